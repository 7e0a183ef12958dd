// An upload connection with an owner, and the loops that an application moves its bytes in.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <string_view>

#include "quillmere.h"

namespace quillmere_test {

struct connection_deleter {
    void operator()(send_file *connection) const { send_file_delete(&connection); }
};
using owned_connection = std::unique_ptr<send_file, connection_deleter>;

struct opened {
    int32_t result;
    owned_connection connection;
};

// The out-parameter holds rubbish before the call.
inline opened open_connection(const char *url, int32_t use_tls, int64_t timeout)
{
    send_file rubbish = {};
    send_file *connection = &rubbish;
    int32_t result = send_file_new(&connection, url, use_tls, timeout);
    EXPECT_NE(connection, &rubbish);
    EXPECT_EQ(connection != nullptr, result == 0);
    return {result, owned_connection(connection)};
}

// What is left when a write fails, is returned.
inline std::string_view write_all(send_file *connection, std::string_view bytes)
{
    while (!bytes.empty()) {
        int32_t written = send_file_write(connection, bytes.data(), bytes.size());
        if (written <= 0)
            return bytes;
        EXPECT_LE(static_cast<size_t>(written), bytes.size());
        bytes.remove_prefix(static_cast<size_t>(written));
    }
    return bytes;
}

struct whole_reply {
    std::string bytes;
    int32_t last_result; // 0 if the peer closed
};

// A TLS record has 16 KiB at most.
inline whole_reply read_all(send_file *connection)
{
    std::string buffer(16 * 1024, '\0');
    whole_reply reply;
    for (;;) {
        reply.last_result = send_file_read(connection, buffer.data(), buffer.size());
        if (reply.last_result <= 0)
            return reply;
        reply.bytes.append(buffer, 0, static_cast<size_t>(reply.last_result));
    }
}

} // namespace quillmere_test
