// What happens to the handles of kept connections: their options, and what of theirs is repeated.
#include <sys/wait.h>
#include <unistd.h>

#include "runtime/kept_handles.h"
#include "support/failure.h"
#include "support/library_fixture.h"
#include "transport/easy_calls.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using quillmere::transfer_handle;
using testing::MatchesRegex;

class KeptHandles : public testing::Test {
protected:
    KeptHandles()
    {
        set_connection_attempts(1);
        set_connection_reuse(1);
        log.clear(); // of the start
        calls.perform = [this](size_t performance) {
            return performance < codes.size() ? codes[performance] : CURLE_OK;
        };
    }

    globals_guard globals;
    log_capture log;
    running_library library{nullptr};
    easy_calls calls;
    std::vector<CURLcode> codes; // of the performances, from 1 on; then success
};

TEST_F(KeptHandles, GetTheOptionsThatNewOnesGet)
{
    fetch(any_url, post_of("body"));
    std::vector<CURLoption> first = calls.names();
    calls.options.clear();

    fetch(any_url, post_of("body"));

    EXPECT_EQ(calls.names(), first);
    EXPECT_EQ(calls.inits, 1u);
    EXPECT_EQ(calls.cleanups, 0u);
}

TEST_F(KeptHandles, AreNotKeptWithoutBeingAskedFor)
{
    set_connection_reuse(0);

    fetch(any_url);
    fetch(any_url);

    EXPECT_EQ(calls.inits, 2u);
    EXPECT_EQ(calls.cleanups, 2u);
}

TEST_F(KeptHandles, AreNotKeptAfterAFailure)
{
    codes = {CURLE_OK, CURLE_OPERATION_TIMEDOUT};

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_EQ(calls.inits, 1u);
    EXPECT_EQ(calls.cleanups, 1u);
}

TEST_F(KeptHandles, AreNotKeptForACertificateFileThatCannotBeRead)
{
    replace_owned_text(ca_cert_pem_path.path, "/no/such/file.pem");

    fetch(any_url);
    fetch(any_url);

    EXPECT_EQ(calls.inits, 2u);
    EXPECT_EQ(calls.cleanups, 2u);
}

TEST_F(KeptHandles, AreDroppedOnceThereIsACertificateFile)
{
    fetch(any_url);

    replace_owned_text(ca_cert_pem_path.path, test_root_path());
    fetch(any_url);

    EXPECT_EQ(calls.inits, 2u);
    EXPECT_EQ(calls.cleanups, 1u);
}

TEST_F(KeptHandles, AreReplacedWithoutATraceWhenTheRequestCouldNotBeSent)
{
    codes = {CURLE_OK, CURLE_OK, CURLE_SEND_ERROR};
    fetch(any_url);

    EXPECT_EQ(fetch(any_url, post_of("body")).code, 0);

    EXPECT_EQ(calls.performances, 3u);
    EXPECT_EQ(calls.inits, 2u);
    EXPECT_EQ(calls.cleanups, 1u);
    EXPECT_EQ(log.text(), "");
}

TEST_F(KeptHandles, LeaveNoTextOfTheirErrorBehind)
{
    fetch(any_url);
    calls.perform = [this](size_t performance) {
        if (performance == 2)
            std::snprintf(calls.error_buffer, CURL_ERROR_SIZE, "stale");
        return performance == 2 ? CURLE_SEND_ERROR : CURLE_GOT_NOTHING;
    };

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_GOT_NOTHING, "")));
}

TEST_F(KeptHandles, AreReplacedOnlyOnce)
{
    codes = {CURLE_OK, CURLE_OK, CURLE_OK, CURLE_SEND_ERROR, CURLE_SEND_ERROR};
    {
        transfer_handle one(nullptr, transfer_handle::source::kept);
        transfer_handle other(nullptr, transfer_handle::source::kept);
        one.keep();
        other.keep();
    }
    fetch(any_url);
    fetch(any_url);

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_EQ(calls.performances, 4u);
    EXPECT_EQ(calls.inits, 3u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SEND_ERROR, "")));
}

TEST_F(KeptHandles, AreNotReplacedWhenTheyAreNew)
{
    codes = {CURLE_OK, CURLE_SEND_ERROR};

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_EQ(calls.performances, 1u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SEND_ERROR, "")));
}

// What libcurl tells of a transfer on a kept handle that failed.
struct failure {
    const char *name;
    CURLcode code;
    CURLINFO info;
    long value;
};

void PrintTo(const failure &each, std::ostream *out) { *out << each.name; }

class CountedFailure : public KeptHandles, public testing::WithParamInterface<failure> {};

TEST_P(CountedFailure, IsNotRepeated)
{
    codes = {CURLE_OK, CURLE_OK, GetParam().code};
    fetch(any_url);
    calls.told[GetParam().info] = GetParam().value;

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_EQ(calls.performances, 2u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(GetParam().code, "")));
}

INSTANTIATE_TEST_SUITE_P(
    All, CountedFailure,
    testing::Values(failure{"time-out", CURLE_OPERATION_TIMEDOUT, CURLINFO_NUM_CONNECTS, 0},
                    failure{"cut off", CURLE_RECV_ERROR, CURLINFO_NUM_CONNECTS, 0},
                    failure{"nothing", CURLE_GOT_NOTHING, CURLINFO_NUM_CONNECTS, 0},
                    failure{"new connection", CURLE_SEND_ERROR, CURLINFO_NUM_CONNECTS, 1},
                    failure{"redirected", CURLE_SEND_ERROR, CURLINFO_REDIRECT_COUNT, 1},
                    failure{"answered", CURLE_SEND_ERROR, CURLINFO_HEADER_SIZE, 25}));

TEST_F(KeptHandles, StayWithTheProcessThatMadeThem)
{
    fetch(any_url);

    pid_t child = ::fork();
    require(child >= 0, "fork");
    if (child == 0) {
        transfer_handle handle(nullptr, transfer_handle::source::kept);
        ::_exit(handle.is_used() || calls.cleanups > 0 ? 1 : 0);
    }
    int status = 0;
    require(::waitpid(child, &status, 0) == child, "waitpid");

    EXPECT_EQ(status, 0);
    EXPECT_TRUE(transfer_handle(nullptr, transfer_handle::source::kept).is_used());
}

TEST_F(KeptHandles, AreClosedWithTheLibrary)
{
    fetch(any_url);

    api_global_cleanup();

    EXPECT_EQ(calls.cleanups, 1u);
    api_global_init(nullptr);
}

TEST_F(KeptHandles, OfBeforeAChangeAreNotTakenBack)
{
    transfer_handle handle(nullptr, transfer_handle::source::kept);
    ssl_disabled = 1;
    transfer_handle(nullptr, transfer_handle::source::kept).keep();

    handle.keep();

    EXPECT_TRUE(transfer_handle(nullptr, transfer_handle::source::kept).is_used());
    EXPECT_FALSE(transfer_handle(nullptr, transfer_handle::source::kept).is_used());
}

} // namespace
} // namespace quillmere_test
