// From what an operation returned to the exit code, the words and whether it is worth another try.
#include "exchange.h"

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

const exchange_setting at_a_service = {"https://h", ca_bundle{"/ca.pem", "SSL_CERT_FILE"},
                                       std::nullopt};

exchange ended_with(std::int32_t status, const std::string &message = {})
{
    exchange ended;
    ended.status = status;
    ended.message = message;
    return ended;
}

exchange http_answer(std::int32_t status, int http)
{
    return ended_with(status,
                      "Response error: received server HTTP response code " + std::to_string(http));
}

exchange transport_error(int code, const std::string &text)
{
    exchange ended = ended_with(-2, "Response error: no server HTTP response code received");
    ended.error = transfer_error{code, text};
    return ended;
}

TEST(ExchangeFailure, HasAnExitCodeForEveryStatus)
{
    struct row {
        std::int32_t status;
        int code;
    };
    for (const row &each : {row{-1, 3}, row{-2, 5}, row{-3, 6}, row{-4, 1}, row{-8, 3}, row{-9, 7},
                            row{1, 3}, row{104, 3}, row{105, 4}, row{107, 3}}) {
        const failure problem = failure_of(ended_with(each.status), "doing", at_a_service);

        EXPECT_EQ(static_cast<int>(problem.code), each.code) << each.status;
        EXPECT_EQ(problem.status, each.status);
    }
}

TEST(ExchangeFailure, TellsTheServicesNumberAndMessage)
{
    const failure problem =
        failure_of(ended_with(107, "Wrong credentials"), "signing in", at_a_service);

    EXPECT_EQ(line_of(problem), "quillmere: signing in failed: 107: Wrong credentials (check the "
                                "e-mail address and the password)\n");
}

TEST(ExchangeFailure, SaysWhatToTryAgainstARefusal)
{
    struct advised {
        std::int32_t number;
        const char *advice;
    };
    for (const advised &each : {advised{108, "application id"}, advised{112, "quillmere ls"},
                                advised{115, "another name"}, advised{117, "make room"},
                                advised{127, "somebody changed it"}}) {
        const failure problem = failure_of(ended_with(each.number, "no"), "acting", at_a_service);
        EXPECT_THAT(problem.advice, HasSubstr(each.advice)) << each.number;
        EXPECT_EQ(problem.code, exit_code::refused);
    }
    EXPECT_EQ(failure_of(ended_with(999, "no"), "acting", at_a_service).advice, "")
        << "nobody knows what helps against that";
}

TEST(ExchangeFailure, OfAnExpiredSessionSaysWhatToDo)
{
    const failure problem = failure_of(ended_with(105, "Gone"), "reading", at_a_service);

    EXPECT_THAT(problem.why, HasSubstr("105: Gone"));
    EXPECT_THAT(problem.advice, HasSubstr("quillmere login"));
}

TEST(ExchangeFailure, NamesTheCertificateAsTheLikelyCause)
{
    const failure problem =
        failure_of(transport_error(60, "self-signed certificate"), "reading", at_a_service);

    EXPECT_EQ(problem.code, exit_code::network);
    EXPECT_THAT(problem.why, HasSubstr("self-signed certificate"));
    EXPECT_THAT(problem.advice, HasSubstr("certificate"));
    EXPECT_THAT(problem.advice, HasSubstr("/ca.pem"));
    EXPECT_THAT(problem.advice, HasSubstr("SSL_CERT_FILE"));
}

TEST(ExchangeFailure, NamesTheRootThatAnEmulatorNeeds)
{
    exchange_setting emulated = at_a_service;
    emulated.emulator_root = "/root.pem";

    EXPECT_THAT(failure_of(transport_error(60, "unknown"), "reading", emulated).advice,
                HasSubstr("/root.pem, with --ca-file"));
}

TEST(ExchangeFailure, OfAnUnreachableEmulatorAsksWhetherItRuns)
{
    exchange_setting emulated = at_a_service;
    emulated.emulator_root = "/root.pem";

    EXPECT_THAT(failure_of(transport_error(7, "refused"), "reading", emulated).advice,
                HasSubstr("emulator"));
    EXPECT_THAT(failure_of(transport_error(7, "refused"), "reading", at_a_service).advice,
                Not(HasSubstr("emulator")));
}

TEST(ExchangeFailure, CallsAnHtmlPageWhatItIs)
{
    for (const std::int32_t status : {-3, -9}) {
        exchange ended = http_answer(status, 200);
        ended.html = true;

        const failure problem = failure_of(ended, "reading", at_a_service);

        EXPECT_THAT(problem.why, HasSubstr("an HTML page came instead of an API reply"));
        EXPECT_THAT(problem.why, HasSubstr("a proxy or login page?"));
        EXPECT_THAT(problem.why, HasSubstr("HTTP 200"));
    }
}

TEST(ExchangeFailure, StaysOnOneLineWhateverTheServiceSays)
{
    const std::string line = line_of(
        failure_of(ended_with(107, "a\nb\x1b[31m\xc2\x9b\xff"), "signing in", at_a_service));

    EXPECT_THAT(line,
                StartsWith("quillmere: signing in failed: 107: a\\nb\\u{1b}[31m\\u{9b}\\xff ("));
    EXPECT_EQ(line.find('\n'), line.size() - 1);
}

TEST(ExchangeFailure, IsJsonForScripts)
{
    const failure problem = failure_of(ended_with(107, "no\n\xff"), "signing in", at_a_service);

    const auto error = nlohmann::json::parse(json_of(problem)).at("error");

    EXPECT_EQ(error.at("code"), 107);
    EXPECT_EQ(error.at("kind"), "refused");
    EXPECT_EQ(error.at("exit_code"), 3);
    EXPECT_EQ(error.at("message"), "signing in failed: 107: no\n\xef\xbf\xbd");
}

TEST(ExchangeFailure, WithoutAnOperationHasNoCode)
{
    const auto error =
        nlohmann::json::parse(json_of(failure(exit_code::usage, "a", "b"))).at("error");

    EXPECT_TRUE(error.at("code").is_null());
    EXPECT_EQ(error.at("kind"), "usage");
    EXPECT_EQ(error.at("advice"), "b");
}

TEST(HttpStatus, IsReadFromTheLibrarysMessageAlone)
{
    EXPECT_EQ(http_status_of("Response error: received server HTTP response code 503"), 503);
    EXPECT_EQ(http_status_of("Response error: received server HTTP response code "), std::nullopt);
    EXPECT_EQ(http_status_of("Response error: received server HTTP response code 5x"),
              std::nullopt);
    EXPECT_EQ(http_status_of("code 503"), std::nullopt);
    EXPECT_EQ(http_status_of(""), std::nullopt);
}

TEST(Repeating, IsWorthItAfterFailuresThatMayPass)
{
    EXPECT_TRUE(worth_repeating(ended_with(-2)));
    for (const int code : {5, 6, 7, 28, 35, 52, 56})
        EXPECT_TRUE(worth_repeating(transport_error(code, ""))) << code;
    for (const int http : {429, 500, 502, 503, 599}) {
        EXPECT_TRUE(worth_repeating(http_answer(-3, http))) << http;
        EXPECT_TRUE(worth_repeating(http_answer(-9, http))) << http;
    }
}

TEST(Repeating, IsNotWorthItOtherwise)
{
    for (const std::int32_t status : {0, -1, -3, -4, -8, -9, 100, 105})
        EXPECT_FALSE(worth_repeating(ended_with(status))) << status;
    for (const int code : {1, 3, 60, 77})
        EXPECT_FALSE(worth_repeating(transport_error(code, ""))) << code;
    for (const int http : {200, 302, 400, 403, 404, 428, 430, 499, 600})
        EXPECT_FALSE(worth_repeating(http_answer(-3, http))) << http;
    EXPECT_FALSE(worth_repeating(http_answer(100, 500)));
}

} // namespace
} // namespace quillmere_test
