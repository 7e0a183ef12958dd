// Replies of an HTTP server, read from a raw connection.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

namespace quillmere::tools {

struct http_reply {
    int status = 0;
    std::string head; ///< status line and fields, with the empty line that ends them
    std::string body; ///< no longer in chunks, if it came so

    bool is_interim() const { return status < 200; }
};

/** The replies on one connection, one after another, those that only announce another among them.
 */
class http_replies {
public:
    /** Fills some of the room; the number of bytes, 0 at the end, or a negative one. */
    using byte_source = std::function<std::int32_t(char *room, std::size_t size)>;

    explicit http_replies(byte_source more) : more_(std::move(more)) {}

    /** The next reply; nothing when the connection ends ahead of it, or when what came is none. */
    std::optional<http_reply> next();

private:
    bool receive();
    bool receive_until(const std::string &text, std::size_t most);
    std::optional<std::string> take(std::size_t size);
    std::optional<std::string> take_line();
    std::optional<std::string> take_chunks();
    std::optional<std::string> take_body(const http_reply &reply);

    byte_source more_;
    std::string received_;
};

} // namespace quillmere::tools
