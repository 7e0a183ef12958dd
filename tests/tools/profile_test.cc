// The configuration file: what of it counts, and what is refused.
#include "profile.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "failure.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

failure failure_in(const std::string &text, const std::optional<std::string> &name = {})
{
    try {
        read_profile(text, name, "/f");
    } catch (const failure &problem) {
        return problem;
    }
    return failure(exit_code::done, "nothing failed");
}

TEST(Profile, IsASectionOfTheFile)
{
    const std::string text = "# a comment\nservice = https://a\n\n[work]\r\n  service=https://b \n"
                             "; another\napp_key = x=y#z\n[default]\nretries = 2\n";

    EXPECT_EQ(read_profile(text, std::nullopt, "f").value("service"), "https://a");
    EXPECT_EQ(read_profile(text, std::nullopt, "f").value("retries"), "2");
    EXPECT_EQ(read_profile(text, "work", "f").value("service"), "https://b");
    EXPECT_EQ(read_profile(text, "work", "f").value("app_key"), "x=y#z");
    EXPECT_EQ(read_profile(text, "work", "f").value("retries"), std::nullopt);
}

TEST(Profile, MayBeCalledOneInItsHeading)
{
    const std::string text = "[profile work]\nemail = a\n[ profile\tplay ]\nemail = b\n"
                             "[profile]\nemail = c\n[profiles]\nemail = d\n";

    EXPECT_EQ(read_profile(text, "work", "f").value("email"), "a");
    EXPECT_EQ(read_profile(text, "play", "f").value("email"), "b");
    EXPECT_EQ(read_profile(text, "profile", "f").value("email"), "c");
    EXPECT_EQ(read_profile(text, "profiles", "f").value("email"), "d");
    EXPECT_THAT(profile_names(text), ElementsAre("work", "play", "profile", "profiles"));
}

TEST(Profile, KnowsTheLineOfEachValue)
{
    const profile chosen = read_profile("\n# a\nemail = a\n", std::nullopt, "/f");

    EXPECT_EQ(chosen.place("email"), "the configuration file /f:3");
}

TEST(Profile, HoldsNoSecretOfAPerson)
{
    for (const char *key : {"password", "Password", "passwd", "token", "session_token",
                            "login_token", "facebook_token", "fb_access_token"}) {
        const failure problem = failure_in(std::string("\n[work]\n") + key + " = hunter2\n");

        EXPECT_THAT(problem.why, StartsWith("the configuration file /f:3: a ")) << key;
        EXPECT_THAT(problem.why, EndsWith(" must not stand here")) << key;
        EXPECT_THAT(line_of(problem), Not(HasSubstr("hunter2"))) << key;
    }
}

TEST(Profile, TellsWhereAndWhatWouldBeRight)
{
    EXPECT_EQ(line_of(failure_in("\nservise = x\n")),
              "quillmere: the configuration file /f:2: unknown key servise (the keys are app_id, "
              "app_key, app_key_file, ca_file, email, proxy, retries, service, session_file, "
              "timeout)\n");
    EXPECT_EQ(line_of(failure_in("[a\n")),
              "quillmere: the configuration file /f:1: expected [profile] or key = value (a line "
              "is [profile], key = value or # and a comment)\n");
    EXPECT_EQ(line_of(failure_in("[a]\n[profile b]\n", "c")),
              "quillmere: the configuration file /f has no profile [c] (it has a, b)\n");
}

TEST(Profile, SurvivesWhatIsNoText)
{
    EXPECT_EQ(failure_in(std::string("a\0b = c", 7)).code, exit_code::local_file);
    EXPECT_EQ(failure_in("\xff\xfe = \x1b[2J").code, exit_code::local_file);
    EXPECT_THAT(line_of(failure_in("\x1b[2J = x")), Not(HasSubstr("\x1b")));
    EXPECT_EQ(read_profile("[]\n[ ]\n", std::nullopt, "/f").value("email"), std::nullopt);
}

TEST(Profile, IsRefusedWhenUnknownOrUnreadable)
{
    EXPECT_THROW(read_profile("[a]\n", "b", "f"), failure);
    EXPECT_THROW(read_profile("servise = x\n", std::nullopt, "f"), failure);
    EXPECT_THROW(read_profile("service\n", std::nullopt, "f"), failure);
    EXPECT_THROW(load_profile("/nonexistent/config", "work"), failure);
    EXPECT_NO_THROW(load_profile("/nonexistent/config", std::nullopt));
}

} // namespace
} // namespace quillmere_test
