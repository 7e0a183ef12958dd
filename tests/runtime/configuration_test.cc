// The exported variables as they come, and the setters of the transfers.
#include <gtest/gtest.h>

#include <ostream>
#include <string>

#include "quillmere.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

class Configuration : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
};

using InitialConfiguration = Configuration;

TEST_F(InitialConfiguration, AsksForTheSecondVersionOfTheInterface)
{
    EXPECT_STREQ(api_version, "2");
}

TEST_F(InitialConfiguration, HasThePlainAndTheTlsBaseAddressAndTheTwoUploadAddresses)
{
    const std::string host = QUILLMERE_SERVICE_HOST;
    const std::string upload = "/api/upload/upload.php?type=desktop";

    EXPECT_EQ(urls[0], "http://" + host);
    EXPECT_EQ(urls[1], "https://" + host);
    EXPECT_EQ(urls[2], "http://" + host + upload);
    EXPECT_EQ(urls[3], "https://" + host + upload);
}

TEST_F(InitialConfiguration, HasFourAddresses) { EXPECT_EQ(sizeof urls / sizeof urls[0], 4u); }

TEST_F(InitialConfiguration, HasAHookThatDoesNothing)
{
    ASSERT_NE(check_api_error, nullptr);

    EXPECT_EQ(check_api_error("https://x", "<response/>", 110, "message"), 0);
    EXPECT_EQ(check_api_error(nullptr, nullptr, 0, nullptr), 0);
    EXPECT_EQ(log.text(), "");
}

TEST_F(InitialConfiguration, HasCheckApiErrorEmptyForItsHook)
{
    EXPECT_EQ(check_api_error, check_api_error_empty);
}

TEST_F(InitialConfiguration, HasNoProxy)
{
    EXPECT_EQ(proxy_server.enabled, 0);
    EXPECT_EQ(proxy_server.host, nullptr);
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.port, 0);
}

TEST_F(InitialConfiguration, VerifiesCertificates) { EXPECT_EQ(ssl_disabled, 0); }

TEST_F(InitialConfiguration, HasNothingForTestHarnesses)
{
    EXPECT_EQ(debug_replace_get_response_from_url, nullptr);
}

TEST_F(InitialConfiguration, HasNoCertificatesThirtySecondsAndSixAttempts)
{
    EXPECT_EQ(ca_cert_pem_path.path, nullptr);
    EXPECT_EQ(ca_cert_pem_path.default_timeout, 30);
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 6);
}

TEST(InitialLogStream, IsStandardOutput) { EXPECT_EQ(output_file, nullptr); }

TEST_F(Configuration, CheckApiErrorEmptyReturnsZeroWhateverItIsTold)
{
    EXPECT_EQ(check_api_error_empty("https://x", "<response/>", -9, "message"), 0);
    EXPECT_EQ(check_api_error_empty(nullptr, nullptr, 1, nullptr), 0);
}

struct timeout_case {
    int64_t seconds;
    bool accepted;
};

std::ostream &operator<<(std::ostream &out, const timeout_case &timeout)
{
    return out << timeout.seconds;
}

class DefaultTimeout : public Configuration, public testing::WithParamInterface<timeout_case> {};

TEST_P(DefaultTimeout, IsAtLeastOneSecond)
{
    const auto &[seconds, accepted] = GetParam();

    int32_t result = set_default_timeout(seconds);

    EXPECT_EQ(result, accepted ? 0 : 1);
    EXPECT_EQ(ca_cert_pem_path.default_timeout, accepted ? seconds : 30);
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 6);
    EXPECT_EQ(log.text(),
              accepted ? "" : "set_default_timeout error: timeout must be greater than 0\n");
}

INSTANTIATE_TEST_SUITE_P(Values, DefaultTimeout,
                         testing::Values(timeout_case{1, true}, timeout_case{2, true},
                                         timeout_case{int64_t{1} << 40, true},
                                         timeout_case{INT64_MAX, true}, timeout_case{0, false},
                                         timeout_case{-1, false}, timeout_case{-5, false},
                                         timeout_case{INT64_MIN, false}));

TEST_F(Configuration, RejectedTimeoutLeavesAnEarlierOne)
{
    set_default_timeout(7);

    set_default_timeout(0);

    EXPECT_EQ(ca_cert_pem_path.default_timeout, 7);
}

struct attempts_case {
    int32_t attempts;
    bool accepted;
};

std::ostream &operator<<(std::ostream &out, const attempts_case &attempts)
{
    return out << attempts.attempts;
}

class ConnectionAttempts : public Configuration,
                           public testing::WithParamInterface<attempts_case> {};

TEST_P(ConnectionAttempts, AreAtLeastOne)
{
    const auto &[attempts, accepted] = GetParam();

    int32_t result = set_connection_attempts(attempts);

    EXPECT_EQ(result, accepted ? 0 : 1);
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, accepted ? attempts : 6);
    EXPECT_EQ(ca_cert_pem_path.default_timeout, 30);
    EXPECT_EQ(log.text(),
              accepted
                  ? ""
                  : "set_connection_attempts error: number of attempts must be greater than 0\n");
}

INSTANTIATE_TEST_SUITE_P(Values, ConnectionAttempts,
                         testing::Values(attempts_case{1, true}, attempts_case{2, true},
                                         attempts_case{INT32_MAX, true}, attempts_case{0, false},
                                         attempts_case{-1, false},
                                         attempts_case{INT32_MIN, false}));

TEST_F(Configuration, RejectedAttemptsLeaveAnEarlierSetting)
{
    set_connection_attempts(3);

    set_connection_attempts(0);

    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 3);
}

TEST_F(Configuration, FreesTextsForTheCaller) { api_free(string_dup("handed out")); }

TEST_F(Configuration, FreesNothingForNull) { api_free(nullptr); }

TEST_F(Configuration, CallsThatAreThereForCompatibilityDoNothing)
{
    std::FILE *before = output_file;

    print_curl_version_info();
    set_windows_output_file(stderr);
    api_thread_init();

    EXPECT_EQ(output_file, before);
    EXPECT_EQ(log.text(), "");
}

} // namespace
} // namespace quillmere_test
