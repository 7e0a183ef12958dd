// What starting and stopping the library does to libcurl.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "interpose/libcurl.h"
#include "quillmere.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

class LibcurlsLifecycle : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
    pretended_libcurl libcurl;
};

TEST_F(LibcurlsLifecycle, BeginsWithEverythingThatLibcurlHas)
{
    api_global_init(nullptr);

    EXPECT_THAT(libcurl.calls,
                testing::ElementsAre("curl_global_init", "curl_version_info", "curl_share_init"));
    EXPECT_EQ(libcurl.global_flags, 3);
    api_global_cleanup();
}

TEST_F(LibcurlsLifecycle, EndsWithOneCleanUp)
{
    api_global_init(nullptr);
    libcurl.calls.clear();

    api_global_cleanup();

    EXPECT_THAT(libcurl.calls, testing::ElementsAre("curl_global_cleanup"));
}

} // namespace
} // namespace quillmere_test
