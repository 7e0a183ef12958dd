// What a script of the scripted server does with one client.
#include "support/scripted_server.h"

#include <cstdlib>

namespace quillmere_test {
namespace {

constexpr std::string_view empty_line = "\r\n\r\n";

size_t announced_length(const request &head)
{
    auto length = head.header("Content-Length");
    return length ? std::strtoul(length->c_str(), nullptr, 10) : 0;
}

} // namespace

connection::connection(byte_stream &stream, recorder record)
    : stream_(stream), record_(std::move(record))
{
}

request connection::read_request()
{
    while (unread_.find(empty_line) == std::string::npos)
        if (!read_more())
            throw stream_broken("the client has closed before its request was whole");
    size_t head_length = unread_.find(empty_line) + empty_line.size();
    request arrived = parse_request_head(unread_.substr(0, head_length));
    unread_.erase(0, head_length);
    // A client that asks would otherwise hold its body back for a second.
    if (arrived.header("Expect"))
        send("HTTP/1.1 100 Continue\r\n\r\n");
    size_t length = announced_length(arrived);
    while (unread_.size() < length)
        if (!read_more())
            throw stream_broken("the client has closed before its body was whole");
    arrived.body = unread_.substr(0, length);
    unread_.erase(0, length);
    record_(arrived);
    return arrived;
}

std::string connection::read_some()
{
    if (unread_.empty())
        read_more();
    return std::exchange(unread_, std::string());
}

void connection::send_in_pieces(std::string_view bytes, size_t piece)
{
    for (size_t start = 0; start < bytes.size(); start += piece)
        send(bytes.substr(start, piece));
}

void connection::send_until_closed(std::string_view piece, std::chrono::milliseconds pause)
{
    do
        send(piece);
    while (!stream_.peer_closes_within(pause));
}

bool connection::read_more()
{
    std::string bytes = stream_.read_some();
    unread_ += bytes;
    return !bytes.empty();
}

connection_script answering(std::string reply)
{
    return answering_with([reply = std::move(reply)](const request &) { return reply; });
}

connection_script answering_with(std::function<std::string(const request &)> reply_to)
{
    return [reply_to = std::move(reply_to)](connection &client) {
        client.send(reply_to(client.read_request()));
        client.close();
    };
}

connection_script closing()
{
    return [](connection &client) {
        client.read_request();
        client.close();
    };
}

connection_script resetting()
{
    return [](connection &client) {
        client.read_request();
        client.reset();
    };
}

connection_script stalling()
{
    return [](connection &client) {
        client.read_request();
        client.stall();
    };
}

} // namespace quillmere_test
