#include "text.h"

#include <charconv>

namespace emulator {
namespace {

struct character {
    std::uint32_t code_point = 0;
    std::size_t length = 0; // in bytes; 0 means that there is no character here
};

// Lengths, and the smallest code point of each length: anything below it is an overlong form.
struct utf8_form {
    unsigned char mask;
    unsigned char lead;
    std::size_t length;
    std::uint32_t smallest;
};

constexpr utf8_form utf8_forms[] = {
    {0x80, 0x00, 1, 0},
    {0xE0, 0xC0, 2, 0x80},
    {0xF0, 0xE0, 3, 0x800},
    {0xF8, 0xF0, 4, 0x10000},
};

character decode_as(const utf8_form &form, std::string_view text)
{
    if (text.size() < form.length)
        return {};
    const auto lead = static_cast<unsigned char>(text.front());
    character result{static_cast<std::uint32_t>(lead & ~form.mask & 0xFF), form.length};
    for (std::size_t at = 1; at < form.length; ++at) {
        const auto byte = static_cast<unsigned char>(text[at]);
        if ((byte & 0xC0) != 0x80)
            return {};
        result.code_point = (result.code_point << 6) | (byte & 0x3Fu);
    }
    return result.code_point >= form.smallest ? result : character{};
}

character first_character(std::string_view text)
{
    const auto lead = static_cast<unsigned char>(text.front());
    for (const utf8_form &form : utf8_forms)
        if ((lead & form.mask) == form.lead)
            return decode_as(form, text);
    return {};
}

bool is_xml_character(std::uint32_t code_point)
{
    if (code_point < 0x20)
        return code_point == '\t' || code_point == '\n' || code_point == '\r';
    if (code_point >= 0xD800 && code_point <= 0xDFFF)
        return false;
    return code_point != 0xFFFE && code_point != 0xFFFF && code_point <= 0x10FFFF;
}

int hex_digit(char digit)
{
    if (digit >= '0' && digit <= '9')
        return digit - '0';
    if (digit >= 'a' && digit <= 'f')
        return digit - 'a' + 10;
    if (digit >= 'A' && digit <= 'F')
        return digit - 'A' + 10;
    return -1;
}

} // namespace

bool is_xml_text(std::string_view text)
{
    while (!text.empty()) {
        const character next = first_character(text);
        if (next.length == 0 || !is_xml_character(next.code_point))
            return false;
        text.remove_prefix(next.length);
    }
    return true;
}

std::optional<std::string> percent_decoded(std::string_view encoded)
{
    std::string decoded;
    decoded.reserve(encoded.size());
    for (std::size_t at = 0; at < encoded.size(); ++at) {
        if (encoded[at] != '%') {
            decoded += encoded[at];
            continue;
        }
        const int high = at + 2 < encoded.size() ? hex_digit(encoded[at + 1]) : -1;
        const int low = at + 2 < encoded.size() ? hex_digit(encoded[at + 2]) : -1;
        if (high < 0 || low < 0)
            return std::nullopt;
        decoded += static_cast<char>(high * 16 + low);
        at += 2;
    }
    return decoded;
}

std::optional<std::uint64_t> parse_decimal(std::string_view text, std::uint64_t largest)
{
    std::uint64_t value = 0;
    const char *end = text.data() + text.size();
    const auto [stop, problem] = std::from_chars(text.data(), end, value, 10);
    if (problem != std::errc() || stop != end || value > largest)
        return std::nullopt;
    return value;
}

std::string_view trimmed(std::string_view text)
{
    constexpr std::string_view blanks = " \t";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos)
        return {};
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

} // namespace emulator
