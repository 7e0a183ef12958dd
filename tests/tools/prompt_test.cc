// Typing a password at a terminal.
#include <csignal>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "program.h"
#include "support/certificates.h"
#include "support/scripted_server.h"
#include "terminal.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;
using testing::Not;

class Prompt : public testing::Test {
protected:
    Prompt()
    {
        home.environment["QUILLMERE_SERVICE"] = server.base_url();
        home.environment["SSL_CERT_FILE"] = test_root_path();
        home.environment["QUILLMERE_APP_ID"] = "7";
        home.environment["QUILLMERE_APP_KEY"] = "key";
    }

    scripted_server server{tls_with(loopback_certificate())};
    program_home home;
};

TEST_F(Prompt, AsksForWhatIsMissingAndHidesThePassword)
{
    server.answer(xml_reply("<response><result>Success</result><session_token>t</session_token>"
                            "</response>"));
    terminal_program program(home.with({"login"}));

    program.wait_for("E-mail: ");
    EXPECT_TRUE(program.shows_typing());
    program.type("someone@example.org\n");
    program.wait_for("Password: ");
    EXPECT_FALSE(program.shows_typing());
    program.type("top-secret\n");

    EXPECT_EQ(program.wait(), 0);
    EXPECT_TRUE(program.shows_typing());
    EXPECT_THAT(program.shown(), Not(HasSubstr("top-secret")));
    ASSERT_EQ(server.requests().size(), 1U);
    EXPECT_EQ(server.requests()[0].parameter("password"), "top%2dsecret");
}

TEST_F(Prompt, GivesTheTerminalBackWhenInterrupted)
{
    terminal_program program(home.with({"login", "someone@example.org"}));
    program.wait_for("Password: ");

    program.type("\x03");

    EXPECT_EQ(program.wait(), 130);
    EXPECT_TRUE(program.shows_typing());
    EXPECT_EQ(server.connections(), 0U);
}

TEST_F(Prompt, GivesTheTerminalBackWhenTerminated)
{
    terminal_program program(home.with({"login", "someone@example.org"}));
    program.wait_for("Password: ");

    program.send_signal(SIGTERM);

    EXPECT_EQ(program.wait(), -SIGTERM);
    EXPECT_TRUE(program.shows_typing());
}

TEST_F(Prompt, TakesNoEmptyPassword)
{
    terminal_program program(home.with({"login", "someone@example.org"}));
    program.wait_for("Password: ");

    program.type("\n");

    EXPECT_EQ(program.wait(), 2);
    EXPECT_EQ(server.connections(), 0U);
}

TEST_F(Prompt, EscapesWhatTheServiceSays)
{
    server.answer(xml_reply("<response><result>Success</result><database>\xc2\x9b"
                            "2Jup</database>"
                            "<memcache>up</memcache></response>"));
    terminal_program program(home.with({"status"}));

    EXPECT_EQ(program.wait(), 0);
    EXPECT_THAT(program.shown(), HasSubstr("Database      \\u{9b}2Jup\r\n"));
}

} // namespace
} // namespace quillmere_test
