// The options of every transfer, in their order, and what happens when libcurl refuses.
#include <cstring>

#include "runtime/dns_share.h"
#include "support/library_fixture.h"
#include "transport/easy_calls.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using quillmere::curl_share_handle;
using testing::ElementsAre;

// Redirects are restrained besides; redirect_test.cc says how. And no TLS session is kept.
const std::vector<CURLoption> further_options = {CURLOPT_MAXREDIRS, CURLOPT_REDIR_PROTOCOLS_STR,
                                                 CURLOPT_PREREQFUNCTION, CURLOPT_PREREQDATA,
                                                 CURLOPT_SSL_SESSIONID_CACHE};

CURLcode succeed(size_t) { return CURLE_OK; }

class TransferOptions : public library_test {
protected:
    TransferOptions() { calls.perform = succeed; }

    easy_calls calls;
};

TEST_F(TransferOptions, StandInTheirOrder)
{
    fetch(any_url);

    EXPECT_THAT(calls.names(further_options),
                ElementsAre(CURLOPT_SHARE, CURLOPT_DNS_CACHE_TIMEOUT, CURLOPT_ERRORBUFFER,
                            CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_TIMEOUT,
                            CURLOPT_NOPROGRESS, CURLOPT_CAINFO, CURLOPT_WRITEFUNCTION,
                            CURLOPT_WRITEDATA));
}

TEST_F(TransferOptions, HaveTheirValues)
{
    fetch(any_url);

    EXPECT_EQ(calls.last(CURLOPT_SHARE).pointer, curl_share_handle);
    EXPECT_NE(curl_share_handle, nullptr);
    EXPECT_EQ(calls.last(CURLOPT_DNS_CACHE_TIMEOUT).number, 300);
    EXPECT_EQ(calls.last(CURLOPT_URL).text, any_url);
    EXPECT_EQ(calls.last(CURLOPT_FOLLOWLOCATION).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_NOSIGNAL).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_NOPROGRESS).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_SSL_SESSIONID_CACHE).number, 0);
    EXPECT_EQ(calls.last(CURLOPT_CAINFO).text, test_root_path());
    EXPECT_EQ(calls.last(CURLOPT_WRITEFUNCTION).pointer,
              reinterpret_cast<const void *>(curl_write_function));
}

TEST_F(TransferOptions, StandInTheirOrderWithEverythingConfigured)
{
    set_user_proxy("proxy.example", 3128, "user", "password");
    proxy_server.enabled = 1;
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);
    ssl_disabled = 1;

    fetch(any_url, post_of("body"));

    EXPECT_THAT(calls.names(further_options),
                ElementsAre(CURLOPT_SHARE, CURLOPT_DNS_CACHE_TIMEOUT, CURLOPT_ERRORBUFFER,
                            CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_TIMEOUT,
                            CURLOPT_NOPROGRESS, CURLOPT_PROXY, CURLOPT_PROXYPORT,
                            CURLOPT_PROXYUSERNAME, CURLOPT_PROXYPASSWORD, CURLOPT_SSL_VERIFYPEER,
                            CURLOPT_WRITEFUNCTION, CURLOPT_WRITEDATA, CURLOPT_SSL_VERIFYPEER,
                            CURLOPT_SSL_VERIFYHOST, CURLOPT_POST, CURLOPT_POSTFIELDSIZE,
                            CURLOPT_POSTFIELDS));
    EXPECT_EQ(calls.last(CURLOPT_PROXY).text, "proxy.example");
    EXPECT_EQ(calls.last(CURLOPT_PROXYPORT).number, 3128);
    EXPECT_EQ(calls.last(CURLOPT_PROXYUSERNAME).text, "user");
    EXPECT_EQ(calls.last(CURLOPT_PROXYPASSWORD).text, "password");
    EXPECT_EQ(calls.last(CURLOPT_SSL_VERIFYPEER).number, 0);
    EXPECT_EQ(calls.last(CURLOPT_SSL_VERIFYHOST).number, 0);
    EXPECT_EQ(calls.last(CURLOPT_POST).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_POSTFIELDSIZE).number, 4);
}

TEST_F(TransferOptions, LeaveTheHostNameVerifiedWithoutCertificates)
{
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);

    fetch(any_url);

    EXPECT_EQ(calls.last(CURLOPT_SSL_VERIFYPEER).number, 0);
    EXPECT_FALSE(calls.has(CURLOPT_SSL_VERIFYHOST));
    EXPECT_FALSE(calls.has(CURLOPT_CAINFO));
}

TEST_F(TransferOptions, ShareNothingWithoutAShareHandle)
{
    CURLSH *kept = std::exchange(curl_share_handle, nullptr);

    exchange result = fetch(any_url);

    curl_share_handle = kept;
    EXPECT_EQ(result.code, 0);
    EXPECT_FALSE(calls.has(CURLOPT_SHARE));
    EXPECT_FALSE(calls.has(CURLOPT_DNS_CACHE_TIMEOUT));
}

TEST_F(TransferOptions, LeaveOutProxyCredentialsThatAreNotSet)
{
    set_user_proxy("proxy.example", 3128, nullptr, nullptr);
    proxy_server.enabled = 1;

    fetch(any_url);

    EXPECT_TRUE(calls.has(CURLOPT_PROXY));
    EXPECT_FALSE(calls.has(CURLOPT_PROXYUSERNAME));
    EXPECT_FALSE(calls.has(CURLOPT_PROXYPASSWORD));
}

class TransferTimeOut : public TransferOptions, public testing::WithParamInterface<timeout_case> {};

TEST_P(TransferTimeOut, IsTheArgumentOrTheDefault)
{
    set_default_timeout(42);

    fetch(any_url, {nullptr, 0}, GetParam().given);

    EXPECT_EQ(calls.last(CURLOPT_TIMEOUT).number, GetParam().used);
}

INSTANTIATE_TEST_SUITE_P(Arguments, TransferTimeOut,
                         testing::Values(timeout_case{0, 42}, timeout_case{-1, 42},
                                         timeout_case{1, 1}, timeout_case{5, 5},
                                         timeout_case{3600, 3600}));

TEST_F(TransferOptions, AreSetForEveryAttemptOnAHandleOfItsOwn)
{
    set_connection_attempts(3);
    calls.perform = [](size_t) { return CURLE_RECV_ERROR; };

    fetch(any_url);

    EXPECT_EQ(calls.inits, 3u);
    EXPECT_EQ(calls.performances, 3u);
    EXPECT_EQ(calls.cleanups, 3u);
    EXPECT_EQ(calls.error_buffer_texts.size(), 3u);
}

TEST_F(TransferOptions, HaveAnErrorBufferThatIsEmptiedOnceACall)
{
    set_connection_attempts(2);
    calls.perform = [this](size_t performance) {
        if (performance == 1)
            std::strcpy(calls.error_buffer, "what libcurl said first");
        return CURLE_RECV_ERROR;
    };

    fetch(any_url);
    fetch(any_url);

    std::string line = std::string("cUrl error: (56) ") + curl_easy_strerror(CURLE_RECV_ERROR);
    EXPECT_EQ(log.text(), line + ": what libcurl said first\n" + line +
                              ": what libcurl said first\n" + line + ": \n" + line + ": \n");
    EXPECT_THAT(calls.error_buffer_texts, ElementsAre("", "what libcurl said first", "", ""));
}

TEST_F(TransferOptions, CountAHandleThatCannotBeMadeAsAnAttempt)
{
    set_connection_attempts(3);
    calls.failing_inits = 3;

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_EQ(calls.inits, 3u);
    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(log.text(), "");
}

TEST_F(TransferOptions, LetALaterHandleSucceed)
{
    set_connection_attempts(3);
    calls.failing_inits = 2;

    EXPECT_EQ(fetch(any_url).code, 0);

    EXPECT_EQ(calls.inits, 3u);
    EXPECT_EQ(calls.performances, 1u);
}

TEST_F(TransferOptions, CountAUrlThatIsTooLongAsAttemptsWithoutALogLine)
{
    set_connection_attempts(3);

    EXPECT_EQ(fetch(any_url + std::string(8 * 1000 * 1000, 'a')).code, -1);

    EXPECT_EQ(calls.inits, 3u);
    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(calls.cleanups, 3u);
    EXPECT_EQ(log.text(), "");
}

class RequiredOption : public TransferOptions, public testing::WithParamInterface<CURLoption> {};

TEST_P(RequiredOption, CountsAsAnAttemptWithoutALogLineWhenItIsRefused)
{
    set_connection_attempts(4);
    calls.refused = GetParam();

    exchange result = fetch(any_url);

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(calls.inits, 4u);
    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(calls.cleanups, 4u);
    EXPECT_EQ(log.text(), "");
}

TEST_P(RequiredOption, FailsBothProbesWhenItIsRefused)
{
    calls.refused = GetParam();

    EXPECT_EQ(check_url_response_code(any_url, 1000), 0);
    EXPECT_EQ(check_url_response(any_url, "q", "", 1000), 0);

    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(calls.cleanups, 2u);
    EXPECT_EQ(log.text(), "cUrl setopt failed.\nResponse does not match: -1\n"
                          "cUrl setopt failed.\n"
                          "Response does not match because -1 does not match 200!");
}

INSTANTIATE_TEST_SUITE_P(Options, RequiredOption,
                         testing::Values(CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL));

class DispensableOption : public TransferOptions, public testing::WithParamInterface<CURLoption> {};

TEST_P(DispensableOption, DoesNotStopATransferWhenItIsRefused)
{
    calls.refused = GetParam();

    EXPECT_EQ(fetch(any_url, post_of("body")).code, 0);

    EXPECT_EQ(calls.performances, 1u);
    EXPECT_EQ(log.text(), "");
}

INSTANTIATE_TEST_SUITE_P(Options, DispensableOption,
                         testing::Values(CURLOPT_SHARE, CURLOPT_DNS_CACHE_TIMEOUT, CURLOPT_TIMEOUT,
                                         CURLOPT_NOPROGRESS, CURLOPT_CAINFO));

// Without the memory to keep one of these, a transfer would go past the proxy or trust the wrong
// certificates.
class ForgottenOption : public TransferOptions, public testing::WithParamInterface<CURLoption> {
protected:
    ForgottenOption()
    {
        set_user_proxy("proxy.example", 3128, "user", "password");
        proxy_server.enabled = 1;
        calls.refused = GetParam();
        calls.refusal = CURLE_OUT_OF_MEMORY;
    }
};

TEST_P(ForgottenOption, FailsAnAttemptBeforeItsTransfer)
{
    set_connection_attempts(2);

    EXPECT_EQ(fetch(any_url).code, -1);

    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(calls.cleanups, 2u);
    EXPECT_EQ(log.text(), "");
}

TEST_P(ForgottenOption, FailsBothProbesBeforeTheirTransfer)
{
    EXPECT_EQ(check_url_response_code(any_url, 1000), 0);
    EXPECT_EQ(check_url_response(any_url, "q", "", 1000), 0);

    EXPECT_EQ(calls.performances, 0u);
}

INSTANTIATE_TEST_SUITE_P(Options, ForgottenOption,
                         testing::Values(CURLOPT_PROXY, CURLOPT_PROXYUSERNAME,
                                         CURLOPT_PROXYPASSWORD, CURLOPT_CAINFO));

TEST_F(TransferOptions, AreFollowedByZeroWhereNoStatusIsTold)
{
    calls.refused_info = CURLINFO_RESPONSE_CODE;

    EXPECT_EQ(fetch(any_url).code, 0);
}

class ProbeOptions : public TransferOptions {};

TEST_F(ProbeOptions, OfTheStatusStandInTheirOrder)
{
    ssl_disabled = 1;

    check_url_response_code(any_url, 1000);

    EXPECT_THAT(calls.names(further_options),
                ElementsAre(CURLOPT_SHARE, CURLOPT_DNS_CACHE_TIMEOUT, CURLOPT_ERRORBUFFER,
                            CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_NOBODY,
                            CURLOPT_TIMEOUT, CURLOPT_NOPROGRESS, CURLOPT_CAINFO));
    EXPECT_EQ(calls.last(CURLOPT_SHARE).pointer, curl_share_handle);
    EXPECT_EQ(calls.last(CURLOPT_DNS_CACHE_TIMEOUT).number, 300);
    EXPECT_EQ(calls.last(CURLOPT_NOBODY).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_NOSIGNAL).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_NOPROGRESS).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_CAINFO).text, test_root_path());
    EXPECT_EQ(calls.error_buffer_texts.at(0), "");
}

TEST_F(ProbeOptions, OfTheBodyStandInTheirOrder)
{
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);

    check_url_response(any_url, "q", "", 1000);

    EXPECT_THAT(calls.names(further_options),
                ElementsAre(CURLOPT_SHARE, CURLOPT_DNS_CACHE_TIMEOUT, CURLOPT_ERRORBUFFER,
                            CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_TIMEOUT,
                            CURLOPT_WRITEFUNCTION, CURLOPT_WRITEDATA, CURLOPT_NOPROGRESS,
                            CURLOPT_SSL_VERIFYPEER));
    EXPECT_EQ(calls.last(CURLOPT_SSL_VERIFYPEER).number, 0);
}

TEST_F(ProbeOptions, MustNotBeRefusedTheLackOfABody)
{
    calls.refused = CURLOPT_NOBODY;

    EXPECT_EQ(check_url_response_code(any_url, 1000), 0);

    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(log.text(), "cUrl setopt failed.\nResponse does not match: -1\n");
}

TEST_F(ProbeOptions, NeedAHandle)
{
    calls.failing_inits = 2;

    EXPECT_EQ(check_url_response_code(any_url, 1000), 0);
    EXPECT_EQ(check_url_response(any_url, "q", "", 1000), 0);

    EXPECT_EQ(log.text(), "Could not initialize cUrl.\nResponse does not match: -1\n"
                          "Could not initialize cUrl.\n"
                          "Response does not match because -1 does not match 200!");
}

TEST_F(ProbeOptions, AreOfNoUseWithoutAStatus)
{
    calls.refused_info = CURLINFO_RESPONSE_CODE;

    EXPECT_EQ(check_url_response_code(any_url, 1000), 0);

    EXPECT_EQ(log.text(), "Response does not match: -1\n");
}

struct rounding {
    int32_t milliseconds;
    long seconds;
};

void PrintTo(const rounding &each, std::ostream *out) { *out << each.milliseconds; }

class ProbeTimeOut : public TransferOptions, public testing::WithParamInterface<rounding> {};

TEST_P(ProbeTimeOut, IsRoundedAwayFromZero)
{
    check_url_response_code(any_url, GetParam().milliseconds);
    EXPECT_EQ(calls.last(CURLOPT_TIMEOUT).number, GetParam().seconds);

    check_url_response(any_url, "q", "", GetParam().milliseconds);
    EXPECT_EQ(calls.last(CURLOPT_TIMEOUT).number, GetParam().seconds);
}

// The last three are what single precision makes of large numbers.
INSTANTIATE_TEST_SUITE_P(Milliseconds, ProbeTimeOut,
                         testing::Values(rounding{0, 0}, rounding{1, 1}, rounding{999, 1},
                                         rounding{1000, 1}, rounding{1001, 2}, rounding{1500, 2},
                                         rounding{2000, 2}, rounding{-1, -1}, rounding{-1000, -1},
                                         rounding{-1500, -2}, rounding{INT32_MAX, 2147484},
                                         rounding{INT32_MIN, -2147484}, rounding{16777217, 16778}));

} // namespace
} // namespace quillmere_test
