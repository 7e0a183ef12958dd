#include "upload.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <utility>
#include <vector>

#include <quillmere.h>
#include <unistd.h>

#include "../failure.h"
#include "../heap.h"
#include "../text.h"
#include "http_reply.h"
#include "sha256.h"

namespace quillmere::tools {

namespace {

// A TLS record holds no more, and a record is sent whole or not at all.
constexpr std::size_t tls_piece = 16 * 1024;
constexpr std::size_t plain_piece = 256 * 1024;

// For less it is not worth a round trip to ask whether it will be refused.
constexpr std::uint64_t size_to_ask_first = 256 * 1024;

using connection_owner = std::unique_ptr<send_file, delete_record<send_file_delete>>;

// RFC 8187. The library's own encoding leaves marks as they are that may not stand there.
std::string encoded_name(const std::string &name)
{
    constexpr char digits[] = "0123456789ABCDEF";
    constexpr std::string_view marks = "!#$&+-.^_`|~";
    std::string encoded;
    for (const char each : name) {
        const bool letter = (each >= 'a' && each <= 'z') || (each >= 'A' && each <= 'Z');
        const auto byte = static_cast<unsigned char>(each);
        if (letter || (each >= '0' && each <= '9') || marks.find(each) != std::string_view::npos)
            encoded += each;
        else
            encoded.append({'%', digits[byte >> 4], digits[byte & 0xf]});
    }
    return encoded;
}

struct address {
    std::string host;   ///< with its port
    std::string target; ///< path and query
};

// What stands in an address goes into the request as it is, so that a blank in it would be taken
// for the end of the target, and a line end for that of the field.
address split_url(const std::string &url)
{
    for (const char each : url)
        if (each <= ' ' || each == 0x7f)
            // Behind the question mark is the session token.
            throw failure(exit_code::other,
                          "the upload address is unusable: " + url.substr(0, url.find('?')),
                          "check the service's address");
    const std::size_t host = url.find("://") + 3;
    const std::size_t path = std::min(url.find('/', host), url.size());
    return {url.substr(host, path - host), url.substr(path)};
}

std::string head_of(const upload &asked)
{
    const address to = split_url(asked.url);
    std::string head = "POST " + to.target + " HTTP/1.1\r\nHost: " + to.host +
                       "\r\nConnection: close\r\nContent-Type: application/octet-stream"
                       "\r\nContent-Length: " +
                       std::to_string(asked.size) +
                       "\r\nContent-Digest: sha-256=:" + base64_of(asked.digest) + ":\r\n";
    if (!asked.name.empty())
        head += "Content-Disposition: " + disposition_of(asked.name) + "\r\n";
    if (asked.size >= size_to_ask_first)
        head += "Expect: 100-continue\r\n";
    return head + "\r\n";
}

bool send_all(send_file *connection, std::string_view bytes)
{
    while (!bytes.empty()) {
        const std::int32_t sent = send_file_write(connection, bytes.data(), bytes.size());
        if (sent <= 0)
            return false;
        bytes.remove_prefix(static_cast<std::size_t>(sent));
    }
    return true;
}

std::size_t read_piece(const upload &asked, std::uint64_t at, std::vector<char> &piece)
{
    const std::size_t wanted = std::min<std::uint64_t>(piece.size(), asked.size - at);
    for (;;) {
        const ssize_t got = ::pread(asked.file, piece.data(), wanted, static_cast<off_t>(at));
        if (got > 0)
            return static_cast<std::size_t>(got);
        if (got == 0)
            throw failure(exit_code::local_file, "the file became shorter while it was sent",
                          "send it again when nobody writes to it");
        if (errno != EINTR)
            throw file_failure("cannot read the file", errno);
    }
}

// A service that refuses stops reading, so that sending fails; what it said is read all the same.
void send_body(const upload &asked, send_file *connection)
{
    std::vector<char> piece(asked.tls ? tls_piece : plain_piece);
    for (std::uint64_t at = 0; at < asked.size;) {
        const std::size_t got = read_piece(asked, at, piece);
        if (!send_all(connection, {piece.data(), got}))
            return;
        at += got;
        asked.sent(got);
    }
}

std::optional<http_reply> exchange_over(const upload &asked, send_file *connection)
{
    http_replies replies([connection](char *room, std::size_t size) {
        return send_file_read(connection, room, size);
    });
    if (!send_all(connection, head_of(asked)))
        return replies.next();
    std::optional<http_reply> reply;
    if (asked.size >= size_to_ask_first) {
        reply = replies.next();
        if (!reply || !reply->is_interim())
            return reply;
    }
    send_body(asked, connection);
    do
        reply = replies.next();
    while (reply && reply->is_interim());
    return reply;
}

std::int32_t without_reply(int http_status, std::int32_t status, char **error_message)
{
    const std::string message =
        "Response error: received server HTTP response code " + std::to_string(http_status);
    *error_message = ::strdup(message.c_str());
    return status;
}

std::int32_t judge(const http_reply &reply, std::string &key, char **error_message)
{
    qm_printf("Got text:\n%s\n", reply.body.c_str());
    if (reply.body.empty())
        return without_reply(reply.status, QM_UNUSABLE_RESPONSE, error_message);
    const std::string whole = reply.head + reply.body;
    char *upload_key = nullptr;
    const std::int32_t result = parse_upload_response(whole.data(), whole.size(), &upload_key);
    const heap_text owned(upload_key);
    if (upload_key != nullptr)
        key = upload_key;
    if (result == QM_OK)
        return QM_OK;
    if (result == QM_MALFORMED_REPLY)
        return without_reply(reply.status, result, error_message);
    std::int32_t error = 0;
    get_error_from_xml(reply.body.data(), reply.body.size(), &error, error_message);
    if (error > 0)
        return error;
    api_free(std::exchange(*error_message, nullptr));
    return without_reply(reply.status, QM_UNUSABLE_RESPONSE, error_message);
}

} // namespace

std::string disposition_of(const std::string &name)
{
    return "attachment; filename*=UTF-8''" + encoded_name(name);
}

std::int32_t send_upload(const upload &asked, std::string &key, char **error_message)
{
    qm_printf("upload url: %s\n", asked.url.c_str());
    send_file *connection = nullptr;
    if (send_file_new(&connection, asked.url.c_str(), asked.tls ? 1 : 0, asked.timeout) != 0)
        return QM_NO_RESPONSE;
    const connection_owner owned(connection);
    const auto reply = exchange_over(asked, connection);
    return reply ? judge(*reply, key, error_message) : QM_NO_RESPONSE;
}

} // namespace quillmere::tools
