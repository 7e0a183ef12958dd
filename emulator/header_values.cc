#include "header_values.h"

#include <algorithm>
#include <map>

#include "digest.h"
#include "errors.h"
#include "text.h"

namespace emulator {
namespace {

constexpr const char *disposition_field = "Content-Disposition";

bool is_blank(char byte) { return byte == ' ' || byte == '\t'; }

std::string lower_case(std::string_view text)
{
    std::string lowered(text);
    for (char &byte : lowered)
        if (byte >= 'A' && byte <= 'Z')
            byte = static_cast<char>(byte - 'A' + 'a');
    return lowered;
}

/** Takes what stands ahead of the separator, and the separator with it. */
std::string_view take_until(std::string_view &text, char separator)
{
    const std::size_t end = std::min(text.find(separator), text.size());
    const std::string_view taken = text.substr(0, end);
    text.remove_prefix(std::min(end + 1, text.size()));
    return taken;
}

[[noreturn]] void refuse_disposition()
{
    throw refusal(error::parameter_invalid, disposition_field);
}

// Between quotes a backslash makes the next byte an ordinary one.
std::string take_quoted(std::string_view &text)
{
    std::string value;
    for (std::size_t at = 1; at < text.size(); ++at) {
        if (text[at] == '"') {
            text.remove_prefix(at + 1);
            if (!trimmed(take_until(text, ';')).empty())
                break;
            return value;
        }
        if (text[at] == '\\' && ++at == text.size())
            break;
        value += text[at];
    }
    refuse_disposition();
}

std::string take_value(std::string_view &text)
{
    while (!text.empty() && is_blank(text.front()))
        text.remove_prefix(1);
    if (!text.empty() && text.front() == '"')
        return take_quoted(text);
    return std::string(trimmed(take_until(text, ';')));
}

std::map<std::string, std::string> parameters_in(std::string_view disposition)
{
    std::map<std::string, std::string> found;
    take_until(disposition, ';'); // "attachment", or whatever kind it is
    while (!trimmed(disposition).empty()) {
        if (disposition.find('=') == std::string_view::npos)
            refuse_disposition();
        const std::string name = lower_case(trimmed(take_until(disposition, '=')));
        if (name.empty() || !found.emplace(name, take_value(disposition)).second)
            refuse_disposition();
    }
    return found;
}

// "UTF-8'en'a%20b" (RFC 8187). The language says nothing to a disk.
std::string extended_text(std::string_view value)
{
    const std::string charset = lower_case(take_until(value, '\''));
    if (charset != "utf-8" || value.find('\'') == std::string_view::npos)
        refuse_disposition();
    take_until(value, '\'');
    const std::optional<std::string> text = percent_decoded(value);
    if (!text)
        refuse_disposition();
    return *text;
}

// ":" base64 ":", with parameters behind it that mean nothing here.
std::optional<std::string> byte_sequence(std::string_view item)
{
    item = trimmed(take_until(item, ';'));
    if (item.size() < 2 || item.front() != ':' || item.back() != ':')
        return std::nullopt;
    return hex_of_base64(item.substr(1, item.size() - 2));
}

} // namespace

std::optional<std::string> file_name_in(std::string_view disposition)
{
    const std::map<std::string, std::string> given = parameters_in(disposition);
    const auto extended = given.find("filename*");
    if (extended != given.end()) // it can hold every name, and wins over the plain one
        return extended_text(extended->second);
    const auto plain = given.find("filename");
    if (plain == given.end())
        return std::nullopt;
    return plain->second;
}

std::optional<std::string> sha256_in(const char *field, std::string_view value)
{
    std::optional<std::string> found;
    while (!value.empty()) {
        std::string_view member = take_until(value, ',');
        if (trimmed(take_until(member, '=')) != "sha-256")
            continue;
        found = byte_sequence(member);
        if (!found || found->size() != 64)
            throw refusal(error::parameter_invalid, field);
    }
    return found;
}

} // namespace emulator
