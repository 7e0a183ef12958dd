// Percent-encoding and the rendering of numbers.
#include <cstring>

#include "text/string_buffer.h"

namespace quillmere {

namespace {

constexpr char digits[] = "0123456789abcdef";

// Bit n stands for character 33 + n: the punctuation that passes unencoded, which is ! ( ) * ^.
constexpr uint64_t acceptable_punctuation = 0x2000000000000381;

constexpr bool acceptable(unsigned char byte)
{
    if ((byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') ||
        (byte >= '0' && byte <= '9'))
        return true;
    return byte >= 33 && byte <= 94 && (acceptable_punctuation >> (byte - 33) & 1) != 0;
}

struct acceptable_table {
    bool passes[256];

    constexpr acceptable_table() : passes()
    {
        for (unsigned byte = 0; byte < 256; ++byte)
            passes[byte] = acceptable(static_cast<unsigned char>(byte));
    }
};

constexpr acceptable_table table;

uint64_t encoded_length(const char *text, uint64_t length)
{
    uint64_t encoded = 0;
    for (uint64_t index = 0; index < length; ++index)
        encoded += table.passes[static_cast<unsigned char>(text[index])] ? 1 : 3;
    return encoded;
}

void encode(char *out, const char *text, uint64_t length)
{
    for (uint64_t index = 0; index < length; ++index) {
        auto byte = static_cast<unsigned char>(text[index]);
        if (table.passes[byte]) {
            *out++ = text[index];
        } else {
            *out++ = '%';
            *out++ = digits[byte >> 4];
            *out++ = digits[byte & 15];
        }
    }
}

} // namespace

} // namespace quillmere

using namespace quillmere;

int32_t url_acceptable_letter(int32_t character)
{
    return table.passes[static_cast<unsigned char>(character)] ? 1 : 0;
}

int64_t string_append_urlencode(string_buffer *buffer, const char *text)
{
    if (!buffer || !text)
        return -1;
    uint64_t length = std::strlen(text);
    encode(extend(buffer, encoded_length(text, length)), text, length);
    return static_cast<int64_t>(buffer->length);
}

char *itoa_s(uint64_t number, int32_t base, char *scratch)
{
    // Index 64 is the NUL's and index 0 stays unused, deliberately: at most 63 digits are written.
    char *first = scratch + 64;
    *first = '\0';
    auto divisor = static_cast<uint64_t>(base);
    do {
        *--first = digits[number % divisor];
        number /= divisor;
    } while (number > 0 && first > scratch + 1);
    return first;
}

int64_t string_append_num_base(string_buffer *buffer, uint64_t number, int32_t base)
{
    if (!buffer)
        return -1;
    char scratch[65];
    return string_append(buffer, itoa_s(number, base, scratch));
}

int64_t string_append_num(string_buffer *buffer, uint64_t number)
{
    return string_append_num_base(buffer, number, 10);
}
