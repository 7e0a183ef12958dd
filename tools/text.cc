#include "text.h"

#include <charconv>
#include <cstdio>

#include <nlohmann/json.hpp>

namespace quillmere::tools {

namespace {

struct code_point {
    std::uint32_t value;
    std::size_t bytes; // 0 when the text does not begin with well-formed UTF-8
};

std::size_t sequence_length(unsigned char first)
{
    if (first < 0x80)
        return 1;
    if (first >= 0xc2 && first < 0xe0)
        return 2;
    if (first >= 0xe0 && first < 0xf0)
        return 3;
    return first >= 0xf0 && first < 0xf5 ? 4 : 0;
}

bool is_overlong_or_surrogate(std::uint32_t value, std::size_t length)
{
    if (length == 3)
        return value < 0x800 || (value >= 0xd800 && value <= 0xdfff);
    return length == 4 && (value < 0x10000 || value > 0x10ffff);
}

code_point first_of(std::string_view text)
{
    const auto first = static_cast<unsigned char>(text[0]);
    const std::size_t length = sequence_length(first);
    if (length <= 1)
        return {first, length};
    if (text.size() < length)
        return {first, 0};

    std::uint32_t value = first & (0x7fU >> length);
    for (std::size_t i = 1; i < length; ++i) {
        const auto next = static_cast<unsigned char>(text[i]);
        if ((next & 0xc0) != 0x80)
            return {first, 0};
        value = (value << 6) | (next & 0x3fU);
    }
    if (is_overlong_or_surrogate(value, length))
        return {first, 0};
    return {value, length};
}

bool is_control(std::uint32_t value)
{
    const bool c0_or_c1 = value < 0x20 || (value >= 0x7f && value < 0xa0);
    const bool direction = value == 0x61c || value == 0x200e || value == 0x200f ||
                           (value >= 0x202a && value <= 0x202e) ||
                           (value >= 0x2066 && value <= 0x2069);
    const bool separator = value == 0x2028 || value == 0x2029;
    return c0_or_c1 || direction || separator;
}

std::string escaped_byte(std::uint32_t value)
{
    char digits[16];
    std::snprintf(digits, sizeof digits, "\\x%02x", value);
    return digits;
}

std::string escaped_code_point(std::uint32_t value)
{
    char digits[16];
    std::snprintf(digits, sizeof digits, "\\u{%x}", value);
    return digits;
}

} // namespace

std::string escape_controls(std::string_view text)
{
    std::string escaped;
    while (!text.empty()) {
        const code_point next = first_of(text);
        if (next.bytes == 0)
            escaped += escaped_byte(next.value);
        else if (next.value == '\n')
            escaped += "\\n";
        else if (next.value == '\t')
            escaped += "\\t";
        else if (is_control(next.value))
            escaped += escaped_code_point(next.value);
        else
            escaped += text.substr(0, next.bytes);
        text.remove_prefix(next.bytes == 0 ? 1 : next.bytes);
    }
    return escaped;
}

std::size_t columns(std::string_view text)
{
    std::size_t count = 0;
    for (const char byte : text)
        count += (static_cast<unsigned char>(byte) & 0xc0) != 0x80;
    return count;
}

std::string json_line(const nlohmann::ordered_json &document)
{
    return document.dump(2, ' ', true, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

std::optional<std::uint64_t> decimal_number(std::string_view text)
{
    std::uint64_t number = 0;
    const char *const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    const bool padded = text.size() > 1 && text[0] == '0';
    if (error != std::errc() || stop != end || padded)
        return std::nullopt;
    return number;
}

nlohmann::ordered_json number_or_text(const char *text)
{
    if (text == nullptr)
        return nullptr;
    if (const auto number = decimal_number(text))
        return *number;
    return text;
}

nlohmann::ordered_json text_or_null(const char *text)
{
    return text == nullptr ? nlohmann::ordered_json(nullptr) : nlohmann::ordered_json(text);
}

nlohmann::ordered_json text_unless_empty(const std::string &text)
{
    return text.empty() ? nlohmann::ordered_json(nullptr) : nlohmann::ordered_json(text);
}

std::string text_or_empty(const char *text) { return text == nullptr ? "" : text; }

std::string lower_case(std::string_view text)
{
    std::string lower(text);
    for (char &letter : lower)
        if (letter >= 'A' && letter <= 'Z')
            letter = static_cast<char>(letter - 'A' + 'a');
    return lower;
}

std::string_view trimmed(std::string_view text)
{
    const char *const blanks = " \t\r\n";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos)
        return {};
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

bool starts_with(std::string_view text, std::string_view beginning)
{
    return text.substr(0, beginning.size()) == beginning;
}

bool ends_with(std::string_view text, std::string_view ending)
{
    return text.size() >= ending.size() && text.substr(text.size() - ending.size()) == ending;
}

} // namespace quillmere::tools
