// Percent-encoding and the rendering of numbers.
#include <algorithm>
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

// A byte as it is sent: itself, or a percent sign and two digits. As long as a word, so that it is
// written in one step.
struct code {
    char text[3];
    unsigned char length;
};
static_assert(sizeof(code) == 4);

constexpr code code_of(unsigned char byte)
{
    if (acceptable(byte))
        return {{static_cast<char>(byte)}, 1};
    return {{'%', digits[byte >> 4], digits[byte & 15]}, 3};
}

struct code_table {
    code codes[256];

    constexpr code_table() : codes()
    {
        for (unsigned byte = 0; byte < 256; ++byte)
            codes[byte] = code_of(static_cast<unsigned char>(byte));
    }
    const code &operator[](char byte) const { return codes[static_cast<unsigned char>(byte)]; }
};

constexpr code_table table;

uint64_t encoded_length(const char *text, uint64_t length)
{
    uint64_t encoded = 0;
    for (uint64_t index = 0; index < length; ++index)
        encoded += table[text[index]].length;
    return encoded;
}

// Writes the codes and a NUL, and returns where that is.
char *encode(char *out, const char *text, uint64_t length)
{
    // Every code as a whole word: what is too much of it is overwritten by the codes behind it and
    // by the NUL, as long as there are so many.
    for (; length > 2; --length, ++text) {
        std::memcpy(out, &table[*text], sizeof(code));
        out += table[*text].length;
    }
    for (; length > 0; --length, ++text)
        out = std::copy_n(table[*text].text, table[*text].length, out);
    *out = '\0';
    return out;
}

// Whether a text fits into the storage even if all of it is encoded.
bool has_room(const string_buffer &buffer, uint64_t length)
{
    return buffer.capacity > buffer.length && length <= (buffer.capacity - buffer.length - 1) / 3;
}

} // namespace

} // namespace quillmere

using namespace quillmere;

int32_t url_acceptable_letter(int32_t character)
{
    return acceptable(static_cast<unsigned char>(character)) ? 1 : 0;
}

int64_t string_append_urlencode(string_buffer *buffer, const char *text)
{
    if (!buffer || !text)
        return -1;
    uint64_t length = std::strlen(text);
    if (has_room(*buffer, length)) {
        char *end = encode(buffer->bytes + buffer->length, text, length);
        buffer->length = static_cast<uint64_t>(end - buffer->bytes);
    } else {
        // Counted first, since the storage grows by what is needed.
        encode(extend(buffer, encoded_length(text, length)), text, length);
    }
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
