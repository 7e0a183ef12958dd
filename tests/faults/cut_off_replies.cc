// Replies that begin well and do not end so.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

const std::string in_status_line = "HTTP/1.1 20";
const std::string in_headers = "HTTP/1.1 200 OK\r\nContent-Type: text/xml\r\nContent-Le";
const std::string short_of_length = "HTTP/1.1 200 OK\r\nContent-Length: 100\r\n\r\n";
const std::string in_body = short_of_length + "<response><result>Succ";
const std::string in_endless_body = "HTTP/1.1 200 OK\r\n\r\n<response><resu";
const std::string in_chunk =
    "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n64\r\n<response><result>Succ";
const std::string between_chunks =
    "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\na\r\n<response>\r\n";

constexpr std::chrono::milliseconds pause_between_drops{20};

connection_script dripping(std::string start, std::string drop)
{
    return sending(std::move(start), [drop = std::move(drop)](connection &client) {
        client.send_until_closed(drop, pause_between_drops);
    });
}

std::vector<fault> closed()
{
    const expectation partial = fails({CURLE_PARTIAL_FILE});
    return {
        {"closed in the status line", {sending(in_status_line, close)}, fails({CURLE_GOT_NOTHING})},
        // libcurl takes the end of the connection for the end of the headers.
        {"closed in the headers",
         {sending(in_headers, close)},
         yields_unusable(200, std::nullopt, QM_UNUSABLE_RESPONSE)},
        {"closed before the body", {sending(short_of_length, close)}, partial},
        {"closed before Content-Length is reached", {sending(in_body, close)}, partial},
        {"closed in a chunk", {sending(in_chunk, close)}, partial},
        {"closed between chunks", {sending(between_chunks, close)}, partial},
        // Of a body without a length, the end of the connection is the end.
        {"closed in a body of any length",
         {sending(in_endless_body, close)},
         yields_unusable(200, "<response><resu", QM_MALFORMED_REPLY)},
    };
}

std::vector<fault> reset_or_stalled()
{
    const expectation lost = fails({CURLE_RECV_ERROR});
    const expectation timed_out = fails({CURLE_OPERATION_TIMEDOUT});
    // One wire for each wait: what waits is the same code over both.
    const std::vector<wire> plainly = {wire::http};
    const std::vector<wire> encrypted = {wire::https};
    auto waits = [&](const char *name, const connection_script &script, const auto &wires) {
        return fault{name, {script}, timed_out}.over(wires).until_time_out();
    };
    return {
        {"reset in the status line", {sending(in_status_line, reset)}, lost},
        {"reset in the headers", {sending(in_headers, reset)}, lost},
        {"reset before the body", {sending(short_of_length, reset)}, lost},
        {"reset before Content-Length is reached", {sending(in_body, reset)}, lost},
        {"reset in a chunk", {sending(in_chunk, reset)}, lost},
        {"reset between chunks", {sending(between_chunks, reset)}, lost},
        {"reset in a body of any length", {sending(in_endless_body, reset)}, lost},
        waits("stalled in the status line", sending(in_status_line, stall), encrypted),
        waits("stalled in the headers", sending(in_headers, stall), plainly),
        waits("stalled in the body", sending(in_body, stall), encrypted),
        waits("stalled in a chunk", sending(in_chunk, stall), plainly),
        waits("drip of headers", dripping("HTTP/1.1 200 OK\r\n", "X-Drop: drip\r\n"), encrypted),
        waits("drip of a body", dripping("HTTP/1.1 200 OK\r\n\r\n", "drip "), plainly),
    };
}

} // namespace

std::vector<fault> cut_off_replies()
{
    std::vector<fault> rows = closed();
    for (fault &each : reset_or_stalled())
        rows.push_back(std::move(each));
    return rows;
}

} // namespace quillmere_test
