#include "http_reply.h"

#include <charconv>
#include <utility>
#include <vector>

#include "../text.h"

namespace quillmere::tools {

namespace {

constexpr std::size_t largest_head = 64 * 1024;
constexpr std::size_t largest_body = 1024 * 1024; // what answers an upload is far smaller
constexpr std::size_t tls_record = 16 * 1024;     // all of which a read should have room for

const std::string line_end = "\r\n";
const std::string head_end = "\r\n\r\n";

std::optional<std::size_t> number_in(std::string_view text, int base)
{
    std::size_t value = 0;
    const char *const end = text.data() + text.size();
    const auto [stop, problem] = std::from_chars(text.data(), end, value, base);
    if (problem != std::errc() || stop == text.data() || value > largest_body)
        return std::nullopt;
    return value;
}

// "HTTP/1.1 200 OK"
int status_in(std::string_view head)
{
    constexpr std::string_view beginning = "HTTP/1.";
    constexpr std::size_t status_at = beginning.size() + 2;
    int status = 0;
    if (starts_with(head, beginning) && head.size() > status_at + 3)
        std::from_chars(head.data() + status_at, head.data() + status_at + 3, status);
    return status;
}

/** The value of a field, whose name is given in lower case; empty when there is none. */
std::string field_in(std::string_view head, std::string_view name)
{
    for (std::size_t at = head.find(line_end); at != std::string_view::npos;
         at = head.find(line_end, at)) {
        at += line_end.size();
        const std::string_view line = head.substr(at, head.find(line_end, at) - at);
        const std::size_t colon = line.find(':');
        if (colon != std::string_view::npos && lower_case(line.substr(0, colon)) == name)
            return std::string(trimmed(line.substr(colon + 1)));
    }
    return {};
}

} // namespace

std::optional<http_reply> http_replies::next()
{
    if (!receive_until(head_end, largest_head))
        return std::nullopt;
    http_reply reply;
    reply.head = *take(received_.find(head_end) + head_end.size());
    reply.status = status_in(reply.head);
    if (reply.status < 100)
        return std::nullopt;
    auto body = take_body(reply);
    if (!body)
        return std::nullopt;
    reply.body = std::move(*body);
    return reply;
}

bool http_replies::receive()
{
    std::vector<char> room(tls_record);
    const std::int32_t got = more_(room.data(), room.size());
    if (got > 0)
        received_.append(room.data(), static_cast<std::size_t>(got));
    return got > 0;
}

bool http_replies::receive_until(const std::string &text, std::size_t most)
{
    while (received_.find(text) == std::string::npos)
        if (received_.size() > most || !receive())
            return false;
    return true;
}

std::optional<std::string> http_replies::take(std::size_t size)
{
    while (received_.size() < size)
        if (!receive())
            return std::nullopt;
    std::string taken = received_.substr(0, size);
    received_.erase(0, size);
    return taken;
}

std::optional<std::string> http_replies::take_line()
{
    if (!receive_until(line_end, largest_head))
        return std::nullopt;
    std::string line = *take(received_.find(line_end) + line_end.size());
    line.resize(line.size() - line_end.size());
    return line;
}

std::optional<std::string> http_replies::take_chunks()
{
    std::string body;
    for (;;) {
        const auto line = take_line();
        const auto size = line ? number_in(*line, 16) : std::nullopt;
        if (!size || body.size() + *size > largest_body)
            return std::nullopt;
        if (*size == 0)
            break;
        const auto chunk = take(*size + line_end.size());
        if (!chunk)
            return std::nullopt;
        body.append(*chunk, 0, *size);
    }
    for (;;) { // fields may stand behind the chunks
        const auto line = take_line();
        if (!line)
            return std::nullopt;
        if (line->empty())
            return body;
    }
}

std::optional<std::string> http_replies::take_body(const http_reply &reply)
{
    if (reply.is_interim() || reply.status == 204 || reply.status == 304)
        return std::string();
    if (ends_with(lower_case(field_in(reply.head, "transfer-encoding")), "chunked"))
        return take_chunks();
    const std::string length = field_in(reply.head, "content-length");
    if (!length.empty()) {
        const auto size = number_in(length, 10);
        return size ? take(*size) : std::nullopt;
    }
    while (received_.size() <= largest_body && receive()) {
    }
    return std::exchange(received_, {});
}

} // namespace quillmere::tools
