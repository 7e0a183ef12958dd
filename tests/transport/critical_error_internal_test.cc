// The one TLS failure that the application is told of.
#include <cstring>

#include "support/library_fixture.h"
#include "transport/easy_calls.h"
#include "transport/exchange.h"
#include "transport/http_exchange.h"

namespace quillmere_test {
namespace {

struct told {
    std::vector<int32_t> event_codes;
    int32_t attempts_from_now_on = 0;
};

extern "C" {
static void note_event(int32_t event_code, void *argument)
{
    auto *noted = static_cast<told *>(argument);
    noted->event_codes.push_back(event_code);
    if (noted->attempts_from_now_on > 0)
        ca_cert_pem_path.connection_attempts = noted->attempts_from_now_on;
}
}

class CriticalError : public library_test {
protected:
    CriticalError() { fail_with(quillmere::critical_error_text); }

    void fail_with(const std::string &text)
    {
        calls.perform = [this, text](size_t) {
            std::strcpy(calls.error_buffer, text.c_str());
            return CURLE_SSL_CONNECT_ERROR;
        };
    }

    static std::string failure_with(const std::string &text)
    {
        return std::string("cUrl error: (35) ") + curl_easy_strerror(CURLE_SSL_CONNECT_ERROR) +
               ": " + text + "\n";
    }

    easy_calls calls;
    told noted;
};

constexpr const char *documented_text = "SSL: SSL_set_session failed: error:140C30F0:SSL "
                                        "routines:SSL_set_session:unable to find ssl method";

TEST_F(CriticalError, HasItsText) { EXPECT_STREQ(quillmere::critical_error_text, documented_text); }

TEST_F(CriticalError, IsToldOnceAnAttempt)
{
    set_connection_attempts(3);
    install_event_handler(note_event, &noted);

    exchange result = fetch(any_url);

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(calls.performances, 3u);
    EXPECT_EQ(noted.event_codes, std::vector<int32_t>(3, 0));
    EXPECT_EQ(log.text(),
              repeated(failure_with(documented_text) + "Detected critical error!\n", 3));
}

TEST_F(CriticalError, IsLoggedWhenNobodyWantsToKnow)
{
    exchange result = fetch(any_url);

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(log.text(), failure_with(documented_text) + "Detected critical error!\n");
}

TEST_F(CriticalError, IsNotToldToAHandlerThatWasTakenAway)
{
    install_event_handler(note_event, &noted);
    install_event_handler(nullptr, nullptr);

    fetch(any_url);

    EXPECT_TRUE(noted.event_codes.empty());
}

TEST_F(CriticalError, IsToldToTheLatestHandlerAlone)
{
    told later;
    install_event_handler(note_event, &noted);
    install_event_handler(note_event, &later);

    fetch(any_url);

    EXPECT_TRUE(noted.event_codes.empty());
    EXPECT_EQ(later.event_codes.size(), 1u);
}

TEST_F(CriticalError, DoesNotKeepALaterAttemptFromSucceeding)
{
    set_connection_attempts(3);
    install_event_handler(note_event, &noted);
    auto fail = calls.perform;
    calls.perform = [fail](size_t performance) {
        return performance == 1 ? fail(performance) : CURLE_OK;
    };

    EXPECT_EQ(fetch(any_url).code, 0);
    EXPECT_EQ(noted.event_codes.size(), 1u);
    EXPECT_EQ(calls.performances, 2u);
}

TEST_F(CriticalError, CannotChangeTheNumberOfAttemptsOfTheRunningCall)
{
    set_connection_attempts(3);
    noted.attempts_from_now_on = 9;
    install_event_handler(note_event, &noted);

    fetch(any_url);

    EXPECT_EQ(calls.performances, 3u);
}

class NearlyCriticalError : public CriticalError,
                            public testing::WithParamInterface<std::string> {};

TEST_P(NearlyCriticalError, IsLikeAnyOther)
{
    install_event_handler(note_event, &noted);
    fail_with(GetParam());

    fetch(any_url);

    EXPECT_TRUE(noted.event_codes.empty());
    EXPECT_EQ(log.text(), failure_with(GetParam()));
}

INSTANTIATE_TEST_SUITE_P(Texts, NearlyCriticalError,
                         testing::Values("", "SSL: SSL_set_session failed",
                                         std::string(documented_text) + "s",
                                         std::string(documented_text).substr(1)));

TEST_F(CriticalError, IsRecognisedInARealFailureToo)
{
    calls.perform = nullptr;
    set_connection_attempts(2);
    install_event_handler(note_event, &noted);
    plain_server.script(closing());
    const char *before = std::exchange(quillmere::critical_error_text, "Empty reply from server");

    fetch(plain_server.base_url() + "/a/path/of/some/length");

    quillmere::critical_error_text = before;
    EXPECT_EQ(noted.event_codes, std::vector<int32_t>(2, 0));
}

TEST_F(CriticalError, IsNothingToTheProbes)
{
    install_event_handler(note_event, &noted);

    EXPECT_EQ(check_url_response_code(any_url, 1000), 0);

    EXPECT_TRUE(noted.event_codes.empty());
    EXPECT_EQ(log.text(), failure_with(documented_text) + "Response does not match: -1\n");
}

} // namespace
} // namespace quillmere_test
