// The share handle when libcurl refuses a part of it, and the one that the library keeps.
#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <vector>

#include "interpose/libcurl.h"
#include "quillmere.h"
#include "runtime/dns_share.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

using quillmere::curl_share_handle;

class ShareHandleMaking : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
    pretended_libcurl libcurl;
};

TEST_F(ShareHandleMaking, SetsTheLocksAndThenSharesTheDnsCacheAlone)
{
    CURLSH *handle = create_curl_share_init();

    ASSERT_EQ(libcurl.options.size(), 3u);
    EXPECT_EQ(libcurl.options[0].option, CURLSHOPT_LOCKFUNC);
    EXPECT_EQ(libcurl.options[1].option, CURLSHOPT_UNLOCKFUNC);
    EXPECT_EQ(libcurl.options[2].option, CURLSHOPT_SHARE);
    EXPECT_EQ(libcurl.options[2].kind, CURL_LOCK_DATA_DNS);
    curl_share_cleanup(handle);
}

TEST_F(ShareHandleMaking, GivesNullInSilenceWithoutAHandle)
{
    libcurl.makes_share_handles = false;

    EXPECT_EQ(create_curl_share_init(), nullptr);
    EXPECT_EQ(log.text(), "");
}

struct refusal {
    CURLSHoption option;
    const char *call;
};

std::ostream &operator<<(std::ostream &out, const refusal &refused) { return out << refused.call; }

// A handle that locks but cannot unlock must not lock any more before it is cleaned up.
CURLSHcode clean_up_half_made(CURLSH *handle)
{
    curl_share_setopt(handle, CURLSHOPT_LOCKFUNC, nullptr);
    curl_share_setopt(handle, CURLSHOPT_UNLOCKFUNC, nullptr);
    return curl_share_cleanup(handle);
}

class RefusedOption : public ShareHandleMaking, public testing::WithParamInterface<refusal> {};

TEST_P(RefusedOption, IsLoggedAndGivesNull)
{
    libcurl.refused_option = GetParam().option;
    libcurl.refusal = CURLSHE_NOMEM;

    void *handle = create_curl_share_init();

    EXPECT_EQ(handle, nullptr);
    EXPECT_EQ(log.text(), std::string("curl_share_setopt(curl_share_handle, ") + GetParam().call +
                              ") failed with code 4. Unable to share handle.\n");
    // Dropped without being cleaned up, which is then up to us.
    ASSERT_EQ(libcurl.handles.size(), 1u);
    EXPECT_TRUE(libcurl.released.empty());
    libcurl.refused_option = CURLSHOPT_NONE;
    EXPECT_EQ(clean_up_half_made(libcurl.handles[0]), CURLSHE_OK);
}

INSTANTIATE_TEST_SUITE_P(
    Options, RefusedOption,
    testing::Values(refusal{CURLSHOPT_LOCKFUNC, "CURLSHOPT_LOCKFUNC, curl_sh_lock_function"},
                    refusal{CURLSHOPT_UNLOCKFUNC, "CURLSHOPT_UNLOCKFUNC, curl_sh_unlock_function"},
                    refusal{CURLSHOPT_SHARE, "CURLSHOPT_SHARE, CURL_LOCK_DATA_DNS"}));

TEST_F(ShareHandleMaking, IsDoneByTheStartAndTheHandleOutlivesTheStop)
{
    api_global_init(nullptr);
    CURLSH *kept = curl_share_handle;
    api_global_cleanup();

    EXPECT_NE(kept, nullptr);
    EXPECT_EQ(curl_share_handle, kept);
}

TEST_F(ShareHandleMaking, ReleasesAtANewStartWhatAnEarlierOneMade)
{
    api_global_init(nullptr);
    CURLSH *earlier = curl_share_handle;
    api_global_cleanup();
    libcurl.released.clear();

    api_global_init(nullptr);

    EXPECT_EQ(libcurl.released, std::vector<CURLSH *>{earlier});
    EXPECT_EQ(curl_share_handle, libcurl.handles.back());
    api_global_cleanup();
}

TEST_F(ShareHandleMaking, FailsWithoutStoppingTheStart)
{
    libcurl.makes_share_handles = false;

    api_global_init("/somewhere/roots.pem");

    EXPECT_EQ(curl_share_handle, nullptr);
    EXPECT_STREQ(ca_cert_pem_path.path, "/somewhere/roots.pem");
    api_global_cleanup();
}

} // namespace
} // namespace quillmere_test
