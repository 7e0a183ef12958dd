// Bytes that are no HTTP, or too much of it.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

const std::string start = "HTTP/1.1 200 OK\r\n";

connection_script saying(const std::string &bytes) { return sending(bytes, close); }

connection_script chunked(const std::string &body)
{
    return saying(start + "Transfer-Encoding: chunked\r\n\r\n" + body);
}

connection_script with_length(const std::string &length)
{
    return saying(start + "Content-Length: " + length + "\r\n\r\n" + good_body);
}

connection_script with_header(const std::string &line)
{
    return saying(start + line + "\r\nContent-Length: " + std::to_string(good_body.size()) +
                  "\r\n\r\n" + good_body);
}

connection_script with_status(const std::string &status)
{
    return saying("HTTP/1.1 " + status + " Odd\r\nContent-Length: " +
                  std::to_string(good_body.size()) + "\r\n\r\n" + good_body);
}

std::string times(size_t count, const std::string &text)
{
    std::string all;
    all.reserve(count * text.size());
    for (size_t i = 0; i < count; ++i)
        all += text;
    return all;
}

std::vector<fault> bad_framing()
{
    const expectation bad_chunk = fails({CURLE_RECV_ERROR});
    const expectation weird = fails({CURLE_WEIRD_SERVER_REPLY});
    return {
        {"chunk size that is no number", {chunked("no\r\n" + good_body)}, bad_chunk},
        {"chunk size below zero", {chunked("-5\r\n" + good_body)}, bad_chunk},
        {"chunk size beyond all bounds", {chunked("fffffffffffffffff\r\n" + good_body)}, bad_chunk},
        {"chunk that is longer than its size", {chunked("1\r\n" + good_body)}, bad_chunk},
        {"length below zero", {with_length("-5")}, weird},
        {"length that is no number", {with_length("many")}, weird},
        // As good as none: the body ends with the connection.
        {"length beyond all bounds", {with_length("99999999999999999999")}, succeeds()},
        // The last one counts.
        {"two lengths", {with_header("Content-Length: 5")}, succeeds()},
        {"HTTP 0 9", {saying(good_body)}, fails({CURLE_UNSUPPORTED_PROTOCOL})},
        {"header without a colon", {with_header("no colon")}, weird},
        {"header with a NUL", {with_header(std::string("X-Nul: \0", 8))}, weird},
    };
}

std::vector<fault> odd_codes()
{
    const expectation unsupported = fails({CURLE_UNSUPPORTED_PROTOCOL});
    auto without_body = [](int64_t code) {
        return yields_unusable(code, std::nullopt, QM_UNUSABLE_RESPONSE);
    };
    return {
        {"status 000", {with_status("000")}, unsupported},
        {"status 099", {with_status("099")}, unsupported},
        {"status 304 with a body", {with_status("304")}, without_body(304)},
        {"status 204 with a body", {with_status("204")}, without_body(204)},
        {"status 101 unasked", {with_status("101")}, succeeds(101)},
        {"status 600", {with_status("600")}, succeeds(600)},
        {"status 999", {with_status("999")}, succeeds(999)},
        {"status 1000", {with_status("1000")}, unsupported},
        {"status 20", {with_status("20")}, unsupported},
        {"status in letters", {with_status("abc")}, unsupported},
        {"HTTP of another version", {saying("HTTP/9.9 200 OK\r\n\r\n" + good_body)}, unsupported},
    };
}

std::vector<fault> too_much()
{
    const expectation too_large = fails({CURLE_RECV_ERROR}); // all headers together
    const std::string kilobyte = "X-Kilobyte: " + std::string(1010, 'k') + "\r\n";
    return {
        {"header of 400 KB",
         {with_header("X-Long: " + std::string(400 * 1024, 'k'))},
         fails({CURLE_OUT_OF_MEMORY})},
        {"400 headers of 1 KB", {with_header(times(400, kilobyte) + "X-Last: last")}, too_large},
        {"100000 interim answers",
         {saying(times(100000, "HTTP/1.1 100 Continue\r\n\r\n") + xml_reply(good_body))},
         too_large},
        {"nothing but an interim answer",
         {saying("HTTP/1.1 100 Continue\r\n\r\n")},
         fails({CURLE_GOT_NOTHING})},
    };
}

} // namespace

std::vector<fault> malformed_replies()
{
    std::vector<fault> rows = bad_framing();
    for (auto more : {odd_codes, too_much})
        for (fault &each : more())
            rows.push_back(std::move(each));
    return rows;
}

} // namespace quillmere_test
