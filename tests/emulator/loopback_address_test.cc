#include "loopback_address.h"

#include <string>

#include <gtest/gtest.h>

using namespace emulator;

TEST(LoopbackAddress, IsANumberOfThisMachineWithAPort)
{
    struct {
        const char *text;
        const char *url;
    } const cases[] = {
        {"127.0.0.1:0", "http://127.0.0.1:0"},
        {"127.1.2.3:65535", "http://127.1.2.3:65535"},
        {"[::1]:4711", "http://[::1]:4711"},
    };
    for (const auto &each : cases) {
        const auto read = parse_loopback_address(each.text);
        ASSERT_TRUE(read) << each.text;
        EXPECT_EQ(read->http_url(), each.url);
    }
}

TEST(LoopbackAddress, IsNothingElse)
{
    for (const char *text : {"",
                             ":",
                             "127.0.0.1",
                             "127.0.0.1:",
                             ":80",
                             "127.0.0.1:65536",
                             "127.0.0.1:-1",
                             "127.0.0.1:80x",
                             "0.0.0.0:0",
                             "192.168.1.1:80",
                             "8.8.8.8:80",
                             "localhost:80",
                             "::1:80",
                             "[::1]",
                             "[::1]:",
                             "[::]:80",
                             "[127.0.0.1]:80",
                             "[::1:80",
                             "::1]:80",
                             "[]:80"})
        EXPECT_FALSE(parse_loopback_address(text)) << text;
}
