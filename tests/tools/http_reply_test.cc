// Replies as an upload gets them, cut in every way.
#include "transfers/http_reply.h"

#include <algorithm>
#include <string>

#include <gtest/gtest.h>

namespace quillmere_test {
namespace {

using quillmere::tools::http_replies;
using quillmere::tools::http_reply;

/** Gives the bytes in pieces of one size, and then the end. */
http_replies::byte_source source_of(std::string bytes, std::size_t piece)
{
    return [bytes = std::move(bytes), piece, at = std::size_t{0}](char *room,
                                                                  std::size_t size) mutable {
        const std::size_t count = std::min({piece, size, bytes.size() - at});
        std::copy_n(bytes.data() + at, count, room);
        at += count;
        return static_cast<std::int32_t>(count);
    };
}

struct whole_reply {
    const char *bytes;
    int status;
    const char *body;
};

class Replies : public testing::TestWithParam<whole_reply> {};

} // namespace

TEST_P(Replies, AreReadHoweverTheyAreCut)
{
    const std::string bytes = GetParam().bytes;
    for (std::size_t piece = 1; piece <= bytes.size(); ++piece) {
        const auto reply = http_replies(source_of(bytes, piece)).next();

        ASSERT_TRUE(reply) << piece;
        EXPECT_EQ(reply->status, GetParam().status);
        EXPECT_EQ(reply->body, GetParam().body) << piece;
    }
}

INSTANTIATE_TEST_SUITE_P(
    HttpReply, Replies,
    testing::Values(whole_reply{"HTTP/1.1 200 OK\r\nContent-Length: 3\r\n\r\nabc", 200, "abc"},
                    whole_reply{"HTTP/1.0 404 No\r\nX: y\r\ncontent-length:0\r\n\r\n", 404, ""},
                    whole_reply{"HTTP/1.1 200 OK\r\n\r\nto the end", 200, "to the end"},
                    whole_reply{"HTTP/1.1 204 No Content\r\n\r\n", 204, ""},
                    whole_reply{"HTTP/1.1 100 Continue\r\n\r\n", 100, ""},
                    whole_reply{"HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n"
                                "3\r\nabc\r\na\r\n0123456789\r\n0\r\n\r\n",
                                200, "abc0123456789"},
                    whole_reply{"HTTP/1.1 200 OK\r\nTransfer-Encoding: gzip, Chunked\r\n\r\n"
                                "1\r\nx\r\n0\r\nTrailer: y\r\n\r\n",
                                200, "x"}));

TEST(HttpReply, FollowsTheOneThatAnnouncedIt)
{
    http_replies replies(source_of("HTTP/1.1 100 Continue\r\n\r\nHTTP/1.1 200 OK\r\n"
                                   "Content-Length: 2\r\n\r\nok",
                                   7));

    EXPECT_TRUE(replies.next()->is_interim());
    const auto last = replies.next();
    EXPECT_FALSE(last->is_interim());
    EXPECT_EQ(last->body, "ok");
    EXPECT_EQ(replies.next(), std::nullopt);
}

TEST(HttpReply, IsNoneWhenItsEndIsMissing)
{
    for (const std::string &whole :
         {std::string("HTTP/1.1 200 OK\r\nContent-Length: 3\r\n\r\nabc"),
          std::string(
              "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n3\r\nabc\r\n0\r\n\r\n")})
        for (std::size_t length = 0; length < whole.size(); ++length)
            EXPECT_EQ(http_replies(source_of(whole.substr(0, length), 5)).next(), std::nullopt)
                << length;
}

TEST(HttpReply, IsNoneWhenItIsSomethingElse)
{
    for (const char *bytes : {"SSH-2.0-x\r\n\r\n", "HTTP/1.1 \r\n\r\n", "HTTP/1.1 abc\r\n\r\n",
                              "HTTP/1.1 200 OK\r\nContent-Length: -1\r\n\r\n",
                              "HTTP/1.1 200 OK\r\nContent-Length: 99999999999\r\n\r\n",
                              "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\nxyz\r\n"})
        EXPECT_EQ(http_replies(source_of(bytes, 100)).next(), std::nullopt) << bytes;
}

TEST(HttpReply, IsNoneWhenItNeverEnds)
{
    const std::string endless_head = "HTTP/1.1 200 OK\r\nX: " + std::string(100'000, 'x');
    const std::string endless_body = "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n"
                                     "fffff\r\n" +
                                     std::string(0xfffff, 'x') + "\r\nfffff\r\n";

    EXPECT_EQ(http_replies(source_of(endless_head, 4096)).next(), std::nullopt);
    EXPECT_EQ(http_replies(source_of(endless_body, 4096)).next(), std::nullopt);
}

TEST(HttpReply, EndsWhenReceivingFails)
{
    http_replies replies([](char *, std::size_t) { return -5; });

    EXPECT_EQ(replies.next(), std::nullopt);
}

} // namespace quillmere_test
