// The command line against a service that does everything that can go wrong.
#include <csignal>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "support/certificates.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::Not;

const std::string limits_reply =
    xml_reply("<response><result>Success</result><max_keys>500</max_keys>"
              "<folder_depth_limit>deep</folder_depth_limit></response>");
const std::string wrong_credentials =
    http_reply(403, "<response><result>Error</result><error>107</error>"
                    "<message>The credentials are wrong</message></response>");

std::string token_reply(const std::string &token)
{
    return xml_reply("<response><result>Success</result><session_token>" + token +
                     "</session_token></response>");
}

class CommandLine : public testing::Test {
protected:
    CommandLine()
    {
        home.environment["QUILLMERE_SERVICE"] = server.base_url();
        home.environment["SSL_CERT_FILE"] = test_root_path();
        home.environment["QUILLMERE_APP_ID"] = "7";
        home.environment["QUILLMERE_APP_KEY"] = "key-of-the-application";
    }

    scripted_server server{tls_with(loopback_certificate())};
    program_home home;
};

TEST_F(CommandLine, PrintsResultsAloneOnStandardOutput)
{
    server.answer(limits_reply);

    const outcome ended = home.run({"limits"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_THAT(ended.out,
                AllOf(HasSubstr("Keys                  500\n"),
                      HasSubstr("Image size            -\n"), Not(HasSubstr("Got text"))));
    EXPECT_THAT(ended.err, IsEmpty());
}

TEST_F(CommandLine, TakesNoReplyWithoutEnd)
{
    const std::string too_long(64 * 1024 * 1024, ' ');
    server.answer(xml_reply(too_long + "<response><result>Success</result></response>"));

    const outcome ended = home.run({"limits", "--retries", "0", "--verbose"});

    EXPECT_NE(ended.exit_status, 0);
    EXPECT_THAT(ended.err, HasSubstr("Response is longer than the limit of 67108864 bytes."));
}

TEST_F(CommandLine, PrintsResultsAsJson)
{
    server.answer(limits_reply);

    const outcome ended = home.run({"limits", "--json"});

    const auto document = nlohmann::json::parse(ended.out);
    EXPECT_EQ(document.size(), 10U);
    EXPECT_EQ(document.at("max_keys"), 500);
    EXPECT_TRUE(document.at("max_objects").is_null());
    EXPECT_THAT(ended.err, IsEmpty());
}

TEST_F(CommandLine, ShowsTheExchangesWithTheirSecretsMasked)
{
    server.answer(token_reply("token-that-nobody-may-see"));
    const std::string log = home.folder().path_of("log");

    const outcome ended = home.run(
        {"login", "someone@example.org", "--password-stdin", "--verbose", "--log-file", log},
        "pass word\n");

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("Session token url:"),
                                 HasSubstr("<session_token>(masked)</session_token>")));
    EXPECT_THAT(content_of(log), HasSubstr("<session_token>(masked)</session_token>"));
    const std::string signature = server.requests().at(0).parameter("signature").value_or("none");
    for (const std::string &secret :
         {std::string("token-that-nobody-may-see"), std::string("pass word"),
          std::string("pass%20word"), std::string("key-of-the-application"), signature})
        EXPECT_THAT(ended.out + ended.err + content_of(log), Not(HasSubstr(secret)));
}

TEST_F(CommandLine, MasksTheTokenThatItSends)
{
    home.sign_in(server.base_url(), "token-that-nobody-may-see");
    server.answer(xml_reply("<response><result>Success</result><device_revision>5</device_revision>"
                            "<async_jobs_in_progress>yes</async_jobs_in_progress></response>"));

    const outcome ended = home.run({"device-status", "--device-id", "4294967295", "--verbose"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_EQ(ended.out, "Device            4294967295\n"
                         "Revision          5\n"
                         "Jobs in progress  yes\n");
    EXPECT_THAT(ended.err, AllOf(HasSubstr("session_token=(masked)&device_id=4294967295"),
                                 Not(HasSubstr("token-that-nobody-may-see"))));
    EXPECT_EQ(server.requests().at(0).parameter("session_token"), "token-that-nobody-may-see");
}

TEST_F(CommandLine, TellsWhatTheServiceRefused)
{
    server.answer(wrong_credentials);

    const outcome ended = home.run({"login", "someone@example.org", "--password-stdin"}, "wrong");

    EXPECT_EQ(ended.exit_status, 3);
    EXPECT_EQ(ended.err, "quillmere: signing in failed: 107: The credentials are wrong (check the "
                         "e-mail address and the password)\n");
    EXPECT_THAT(ended.out, IsEmpty());
    EXPECT_EQ(server.connections(), 1U);
}

TEST_F(CommandLine, TellsErrorsInJsonToo)
{
    server.answer(wrong_credentials);

    const outcome ended = home.run({"--json", "limits"});

    const auto error = nlohmann::json::parse(ended.out).at("error");
    EXPECT_EQ(ended.exit_status, 3);
    EXPECT_EQ(error.at("code"), 107);
    EXPECT_EQ(error.at("kind"), "refused");
    EXPECT_THAT(ended.err, IsEmpty());
}

TEST_F(CommandLine, RepeatsAReadThatMaySucceedLater)
{
    server.next(
        {resetting(), answering(http_reply(503, "<html>busy</html>")), answering(limits_reply)});

    const outcome ended = home.run({"limits"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_EQ(server.connections(), 3U);
    EXPECT_THAT(ended.err, HasSubstr("trying again"));
}

TEST_F(CommandLine, RepeatsNoMoreThanItMay)
{
    server.script(resetting());

    EXPECT_EQ(home.run({"limits", "--retries", "1"}).exit_status, 5);
    EXPECT_EQ(server.connections(), 2U);
}

TEST_F(CommandLine, SignsInNoMoreThanOnce)
{
    server.script(resetting());

    const outcome ended = home.run({"login", "someone@example.org", "--password-stdin"}, "secret");

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_EQ(server.connections(), 1U);
}

TEST_F(CommandLine, CallsAnHtmlPageWhatItIs)
{
    server.answer(http_reply(200, "<!DOCTYPE html><html><body>Sign in<br></body></html>"));

    const outcome ended = home.run({"limits"});

    EXPECT_EQ(ended.exit_status, 7);
    EXPECT_THAT(ended.err, HasSubstr("an HTML page came instead of an API reply"));
}

TEST_F(CommandLine, CallsAWellFormedHtmlPageTheSame)
{
    server.answer(http_reply(200, "<?xml version=\"1.0\"?>\n<html><body>Sign in</body></html>"));

    const outcome ended = home.run({"limits"});

    EXPECT_EQ(ended.exit_status, 6);
    EXPECT_THAT(ended.err, HasSubstr("an HTML page came instead of an API reply"));
}

TEST_F(CommandLine, TellsAnswersThatItCannotUse)
{
    server.answer(xml_reply("<response><result>Succ"));
    EXPECT_EQ(home.run({"limits"}).exit_status, 7);

    server.answer(http_reply(404, ""));
    const outcome ended = home.run({"limits"});
    EXPECT_EQ(ended.exit_status, 6);
    EXPECT_THAT(ended.err, HasSubstr("HTTP 404"));
}

TEST_F(CommandLine, SendsAnExpiredSessionToSignInAgain)
{
    home.sign_in(server.base_url(), "old");
    server.answer(http_reply(403, "<response><result>Error</result><error>105</error>"
                                  "<message>Expired</message></response>"));

    const outcome ended = home.run({"device-status"});

    EXPECT_EQ(ended.exit_status, 4);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("105: Expired"), HasSubstr("quillmere login")));
}

TEST_F(CommandLine, NeedsASessionForTheAccount)
{
    EXPECT_EQ(home.run({"device-status"}).exit_status, 4);
    EXPECT_EQ(server.connections(), 0U);
}

TEST_F(CommandLine, GivesASessionToNoOtherService)
{
    home.sign_in("https://elsewhere.example", "token");

    const outcome ended = home.run({"device-status"});

    EXPECT_EQ(ended.exit_status, 4);
    EXPECT_THAT(ended.err, HasSubstr("https://elsewhere.example"));
    EXPECT_EQ(server.connections(), 0U);
}

TEST_F(CommandLine, AsksTheServiceOfTheSession)
{
    home.environment["QUILLMERE_SERVICE"] = std::nullopt;
    home.sign_in(server.base_url(), "token");
    server.answer(limits_reply);

    EXPECT_EQ(home.run({"limits"}).exit_status, 0);
    EXPECT_EQ(server.connections(), 1U);
}

TEST_F(CommandLine, SuspectsTheCertificate)
{
    const temporary_folder folder;
    const std::string other_root =
        folder.write("other.pem", certificate_authority("Another root").root().certificate_pem());

    const outcome ended = home.run({"limits", "--ca-file", other_root});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("certificate"), HasSubstr(other_root),
                                 HasSubstr("--ca-file"), Not(HasSubstr("trying again"))));
    EXPECT_THAT(server.requests(), IsEmpty());
}

TEST_F(CommandLine, TakesAnyCertificateOnlyWithAWarning)
{
    server.answer(limits_reply);
    home.environment["SSL_CERT_FILE"] = std::nullopt;

    const outcome ended = home.run({"limits", "--insecure"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_THAT(ended.err, HasSubstr("warning: the service's certificate is not verified"));
}

TEST_F(CommandLine, FailsBeforeConnectingWithoutTheNamedBundle)
{
    const outcome ended = home.run({"limits", "--ca-file", home.folder().path_of("absent")});

    EXPECT_EQ(ended.exit_status, 9);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("--ca-file"), HasSubstr("No such file")));
    EXPECT_EQ(server.connections(), 0U);
}

TEST_F(CommandLine, TellsThatNobodyListens)
{
    const refused_port port;

    const outcome ended =
        home.run({"limits", "--service", port.base_url("https"), "--retries", "0"});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_THAT(ended.err, MatchesRegex("quillmere: [^\n]*refused[^\n]*\n|"
                                        "quillmere: [^\n]*connect[^\n]*\n"));
}

TEST_F(CommandLine, EndsAtTheTimeOut)
{
    server.script(stalling());

    const outcome ended = home.run({"limits", "--timeout", "1", "--retries", "0"});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_THAT(ended.err, HasSubstr("--timeout"));
}

TEST_F(CommandLine, EndsAtOnceWhenInterrupted)
{
    server.script(stalling());
    process running(home.with({"limits"}));
    ASSERT_TRUE(server.wait_for_requests(1));

    running.send_signal(SIGINT);

    EXPECT_EQ(running.wait().exit_status, 130);
}

TEST_F(CommandLine, EndsBySigtermAsAnyProgramDoes)
{
    server.script(stalling());
    process running(home.with({"limits"}));
    ASSERT_TRUE(server.wait_for_requests(1));

    EXPECT_EQ(running.terminate().signal, SIGTERM);
}

} // namespace
} // namespace quillmere_test
