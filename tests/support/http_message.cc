#include "support/http_message.h"

#include <strings.h>

namespace quillmere_test {
namespace {

std::string take_until(std::string_view &rest, std::string_view separator)
{
    size_t end = rest.find(separator);
    std::string taken(rest.substr(0, end));
    rest.remove_prefix(end == std::string_view::npos ? rest.size() : end + separator.size());
    return taken;
}

std::string_view without_leading_blanks(std::string_view text)
{
    size_t start = text.find_first_not_of(" \t");
    return start == std::string_view::npos ? std::string_view() : text.substr(start);
}

bool same_name(std::string_view left, std::string_view right)
{
    return left.size() == right.size() &&
           ::strncasecmp(left.data(), right.data(), left.size()) == 0;
}

} // namespace

std::optional<std::string> request::header(std::string_view name) const
{
    for (const auto &[key, value] : headers)
        if (same_name(key, name))
            return value;
    return std::nullopt;
}

std::string request::path() const { return target.substr(0, target.find('?')); }

std::optional<std::string> request::parameter(std::string_view name) const
{
    size_t question = target.find('?');
    if (question == std::string::npos)
        return std::nullopt;
    std::string_view rest = std::string_view(target).substr(question + 1);
    while (!rest.empty()) {
        std::string pair = take_until(rest, "&");
        std::string_view value = pair;
        if (take_until(value, "=") == name)
            return std::string(value);
    }
    return std::nullopt;
}

request parse_request_head(std::string head)
{
    request parsed;
    parsed.head = std::move(head);
    std::string_view rest = parsed.head;
    std::string start_line = take_until(rest, "\r\n");
    std::string_view words = start_line;
    parsed.method = take_until(words, " ");
    parsed.target = take_until(words, " ");
    parsed.version = words;
    while (!rest.empty()) {
        std::string line = take_until(rest, "\r\n");
        if (line.empty())
            break;
        std::string_view value = line;
        std::string name = take_until(value, ":");
        parsed.headers.emplace_back(name, without_leading_blanks(value));
    }
    return parsed;
}

std::string http_reply(int status, std::string_view body, const header_lines &extra_headers)
{
    // No client looks at the reason, so that every status has the same one.
    std::string reply = "HTTP/1.1 " + std::to_string(status) + " Answer\r\n";
    for (const std::string &line : extra_headers)
        reply += line + "\r\n";
    // Answers of these kinds have no body by definition, and may not announce one.
    if (status >= 200 && status != 204 && status != 304)
        reply += "Content-Length: " + std::to_string(body.size()) + "\r\n";
    reply += "Connection: close\r\n\r\n";
    reply += body;
    return reply;
}

std::string xml_reply(std::string_view body)
{
    return http_reply(200, body, {"Content-Type: text/xml; charset=utf-8"});
}

std::string success_body(std::string_view elements)
{
    return "<response><result>Success</result>" + std::string(elements) + "</response>";
}

std::string success_reply(std::string_view elements) { return xml_reply(success_body(elements)); }

} // namespace quillmere_test
