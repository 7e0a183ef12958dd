#include "transfers/upload_route.h"

#include <gtest/gtest.h>

#include "failure.h"
#include "transfers/upload.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;

settings at(const std::string &base, const std::string &plain_base = {})
{
    settings chosen;
    chosen.addresses.secure = base;
    if (!plain_base.empty())
        chosen.emulator = emulator_address{base, plain_base, "ca.pem"};
    return chosen;
}

} // namespace

TEST(UploadRoute, IsTlsOnTheStandardPort)
{
    for (const char *base : {"https://files.example.org", "https://files.example.org:443",
                             "https://[::1]", "https://[::1]:443", "https://host/base"})
        EXPECT_EQ(upload_route_of(at(base)), upload_route::tls) << base;
    EXPECT_EQ(upload_route_of(at("https://127.0.0.1", "http://127.0.0.1:80")), upload_route::tls);
}

TEST(UploadRoute, IsPlainToAnEmulatorOnThisMachine)
{
    for (const char *plain : {"http://127.0.0.1:80", "http://127.1.2.3:80", "http://localhost:80",
                              "http://[::1]:80", "http://LOCALHOST"})
        EXPECT_EQ(upload_route_of(at("https://127.0.0.1:4443", plain)), upload_route::plain)
            << plain;
}

TEST(UploadRoute, LeadsNowhereElse)
{
    EXPECT_THROW(upload_route_of(at("https://files.example.org:4443")), failure);
    EXPECT_THROW(upload_route_of(at("https://127.0.0.1:4443")), failure);
    for (const char *plain :
         {"http://files.example.org", "http://128.0.0.1", "http://127.0.0.1.example.org",
          "http://127.0.0.1@example.org", "http://127.0.0.1:80@example.org", "http://[::2]",
          "http://localhost.example.org", "https://127.0.0.1", "http://", "http://[::1"})
        EXPECT_THROW(upload_route_of(at("https://127.0.0.1:4443", plain)), failure) << plain;
}

TEST(UploadRoute, OfANameEncodesAllThatCouldBeMistaken)
{
    EXPECT_EQ(disposition_of("a-B_9.txt"), "attachment; filename*=UTF-8''a-B_9.txt");
    EXPECT_EQ(disposition_of("\xc3\xa4 \"'%*;()\r\n"),
              "attachment; filename*=UTF-8''%C3%A4%20%22%27%25%2A%3B%28%29%0D%0A");
}

} // namespace quillmere_test
