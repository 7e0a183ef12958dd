// Running out of memory: where that has a result of its own, and where it is the end.
#include <gtest/gtest.h>

#include <csignal>
#include <ostream>
#include <string>

#include "interpose/heap.h"
#include "interpose/libcurl.h"
#include "quillmere.h"
#include "runtime/lifecycle.h"
#include "runtime/tls_locks.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"
#include "support/process.h"

namespace quillmere_test {
namespace {

class Exhaustion : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
};

TEST_F(Exhaustion, LeavesTheProxysTextsNull)
{
    {
        starved_heap starved(0);
        set_user_proxy("proxy.example", 3128, "someone", "secret");
        EXPECT_EQ(starved.refused(), 3u);
    }

    EXPECT_EQ(proxy_server.host, nullptr);
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.port, 3128);
    EXPECT_EQ(proxy_server.enabled, 0);
    EXPECT_EQ(log.text(), "");
}

TEST_F(Exhaustion, LeavesOnlyThoseOfTheProxysTextsNullThatFoundNoRoom)
{
    {
        starved_heap starved(1);
        set_user_proxy("proxy.example", 3128, "someone", "secret");
    }

    EXPECT_STREQ(proxy_server.host, "proxy.example");
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
}

TEST_F(Exhaustion, StillReplacesAnEarlierProxy)
{
    set_user_proxy("earlier.example", 1, "earlier", "earlier");

    {
        starved_heap starved(0);
        set_user_proxy("proxy.example", 3128, nullptr, nullptr);
    }

    EXPECT_EQ(proxy_server.host, nullptr);
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.port, 3128);
}

std::string log_up_to_the_locks(const std::string &whole)
{
    return whole.substr(0, whole.find("Mutex locks requested: "));
}

TEST_F(Exhaustion, LeavesTlsInitWithoutLocks)
{
    pretended_libcurl libcurl;
    libcurl.ssl_version = "OpenSSL/3.0.11";
    pthread_mutex_t *mutexes_before = quillmere::tls_mutexes;
    int32_t installed_before = quillmere::tls_locks_installed;
    int32_t result = 0;

    {
        starved_heap starved(0);
        result = tls_init();
    }

    EXPECT_EQ(result, -1);
    EXPECT_EQ(quillmere::tls_mutexes, mutexes_before);
    EXPECT_EQ(quillmere::tls_locks_installed, installed_before);
    EXPECT_EQ(log.text(), log_up_to_the_locks(log.text()) +
                              "Mutex locks requested: 1.\nUnable to create mutexes.\n");
    EXPECT_EQ(log.text().find("Curl SSL version: OpenSSL/3.0.11\nOpenSSL version: "), 0u);
}

struct shortage {
    size_t allowed;
    size_t refused;
};

class RepeatedTlsInit : public Exhaustion, public testing::WithParamInterface<shortage> {};

TEST_P(RepeatedTlsInit, KeepsTheEarlierLocksWhenItFindsNoRoom)
{
    pretended_libcurl libcurl;
    libcurl.ssl_version = "OpenSSL/3.0.11";
    tls_init();
    pthread_mutex_t *earlier = quillmere::tls_mutexes;
    int64_t held = blocks_held();
    int32_t result = 0;

    {
        starved_heap starved(GetParam().allowed, GetParam().refused);
        result = tls_init();
    }

    EXPECT_EQ(result, -1);
    EXPECT_EQ(quillmere::tls_mutexes, earlier);
    EXPECT_EQ(blocks_held(), held);
}

INSTANTIATE_TEST_SUITE_P(Shortages, RepeatedTlsInit,
                         testing::Values(shortage{0, 1}, shortage{1, 1}, shortage{0, 2}));

TEST_F(Exhaustion, OfTheLocksDoesNotStopTheStart)
{
    pretended_libcurl libcurl;
    libcurl.ssl_version = "OpenSSL/3.0.11";
    pthread_mutex_t *mutexes_before = quillmere::tls_mutexes;

    {
        starved_heap starved(0, 1);
        api_global_init("/somewhere/roots.pem");
    }

    EXPECT_EQ(quillmere::tls_mutexes, mutexes_before);
    EXPECT_NE(quillmere::event_handler, nullptr);
    EXPECT_STREQ(ca_cert_pem_path.path, "/somewhere/roots.pem");
    api_global_cleanup();
}

TEST_F(Exhaustion, IsNoMatterForMakingAShareHandle)
{
    starved_heap starved(0);

    CURLSH *handle = create_curl_share_init();

    EXPECT_NE(handle, nullptr);
    EXPECT_EQ(starved.refused(), 0u);
    curl_share_cleanup(handle);
}

// What the program quillmere_exhausted is told to do, and at which allocation its heap ends.
struct fatal_case {
    const char *call;
    int allowed;
};

std::ostream &operator<<(std::ostream &out, const fatal_case &fatal)
{
    return out << fatal.call << " after " << fatal.allowed;
}

class FatalExhaustion : public testing::TestWithParam<fatal_case> {};

TEST_P(FatalExhaustion, WritesOneLineToStandardErrorAndAborts)
{
    command starving;
    starving.program = QUILLMERE_EXHAUSTED;
    starving.arguments = {GetParam().call, std::to_string(GetParam().allowed)};

    outcome result = run(starving);

    EXPECT_EQ(result.signal, SIGABRT);
    EXPECT_EQ(result.err, "quillmere: out of memory\n");
    EXPECT_EQ(result.out, "");
}

INSTANTIATE_TEST_SUITE_P(
    Calls, FatalExhaustion,
    testing::Values(fatal_case{"string_new", 0}, fatal_case{"string_new", 1},
                    fatal_case{"string_append", 0}, fatal_case{"string_append", 1},
                    fatal_case{"string_append_len of everything", 1},
                    fatal_case{"string_append_urlencode", 0}, fatal_case{"string_append_num", 0},
                    fatal_case{"string_add_obfs_range", 0}, fatal_case{"string_append_obfs", 1},
                    fatal_case{"string_get_obfs", 0}, fatal_case{"string_get_obfs", 1},
                    fatal_case{"string_dup", 0}, fatal_case{"system_status_new", 0},
                    fatal_case{"system_status_new", 1}, fatal_case{"system_status_new", 2},
                    fatal_case{"dynamic lock", 0}, fatal_case{"api_global_init", 1},
                    fatal_case{"api_global_init", 2}));

// The same calls with room enough, so that the deaths above are known to be of hunger.
class SufficientMemory : public testing::TestWithParam<const char *> {};

TEST_P(SufficientMemory, IsNoReasonToDie)
{
    command fed;
    fed.program = QUILLMERE_EXHAUSTED;
    fed.arguments = {GetParam(), "9"};

    outcome result = run(fed);

    EXPECT_EQ(result.exit_status, 0);
    EXPECT_EQ(result.err, "");
}

INSTANTIATE_TEST_SUITE_P(Calls, SufficientMemory,
                         testing::Values("string_new", "string_append", "string_append_urlencode",
                                         "string_append_num", "string_add_obfs_range",
                                         "string_append_obfs", "string_get_obfs", "string_dup",
                                         "system_status_new", "dynamic lock", "api_global_init"));

} // namespace
} // namespace quillmere_test
