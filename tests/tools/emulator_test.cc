// The command line, the library and the local service together, as a user would run them.
#include <filesystem>
#include <string>

#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "emulator_account.h"
#include "support/certificates.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::Not;

class Emulator : public emulator_account {
protected:
    std::string token() const
    {
        return nlohmann::json::parse(content_of(home.session_path())).at("session_token");
    }
};

TEST_F(Emulator, LetsAUserSignInAndReadTheirDevice)
{
    const outcome signed_in = sign_in();
    const outcome read = home.run({"device-status"});

    EXPECT_EQ(signed_in.exit_status, 0) << signed_in.err;
    EXPECT_EQ(signed_in.out, "Signed in to " + base + " as " + account_email + "\n");
    EXPECT_EQ(read.exit_status, 0) << read.err;
    EXPECT_THAT(read.out, MatchesRegex("Device            0\n"
                                       "Revision          [0-9]+\n"
                                       "Jobs in progress  (yes|no)\n"));
}

TEST_F(Emulator, LeavesNothingForTheDoctorToFind)
{
    const nlohmann::json examined = result_of({"doctor"});

    EXPECT_EQ(examined.at("healthy"), true);
    for (const auto &each : examined.at("steps"))
        EXPECT_EQ(each.at("result"), "ok") << each;
}

TEST_F(Emulator, AcceptsAFacebookToken)
{
    const outcome ended = home.run(
        {"login", "--facebook-token-file", home.folder().path_of("facebook-token"), "--json"});

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(nlohmann::json::parse(ended.out).at("service"), base);
    EXPECT_EQ(home.run({"device-status"}).exit_status, 0);
}

TEST_F(Emulator, RefusesAWrongPasswordByNumber)
{
    const outcome ended = home.run({"login", account_email, "--password-stdin"}, "wrong\n");

    EXPECT_EQ(ended.exit_status, 3);
    EXPECT_THAT(ended.err, MatchesRegex("quillmere: signing in failed: 107: [^\n]+\n"));
    EXPECT_THAT(ended.out, IsEmpty());
    EXPECT_FALSE(std::filesystem::exists(home.session_path()));
}

TEST_F(Emulator, RefusesAWrongApplicationKey)
{
    home.environment["QUILLMERE_APP_ID"] = "42";
    home.environment["QUILLMERE_APP_KEY"] = "not-the-key";

    const outcome ended = sign_in();

    EXPECT_EQ(ended.exit_status, 3);
    EXPECT_THAT(ended.err, HasSubstr("signature"));
}

TEST_F(Emulator, ShowsItsStatusAndLimitsToAnybody)
{
    const outcome status = home.run({"status"});
    const outcome limits = home.run({"limits", "--json"});

    EXPECT_EQ(status.exit_status, 0) << status.err;
    EXPECT_THAT(status.out, MatchesRegex("Database      [^-].*\nMemory cache  [^-].*\n"));
    EXPECT_EQ(limits.exit_status, 0) << limits.err;
    const auto document = nlohmann::json::parse(limits.out);
    for (const auto &[key, value] : document.items())
        EXPECT_TRUE(value.is_number()) << key;
}

TEST_F(Emulator, IsReachedPastAProxy)
{
    const refused_port proxy;
    home.environment["https_proxy"] = proxy.base_url();

    EXPECT_EQ(home.run({"limits", "--retries", "0"}).exit_status, 0);
}

TEST_F(Emulator, SessionIsForItsOwnerAlone)
{
    sign_in();

    struct stat facts = {};
    ASSERT_EQ(::stat(home.session_path().c_str(), &facts), 0);
    EXPECT_EQ(facts.st_mode & 0777U, 0600U);
    const auto kept = nlohmann::json::parse(content_of(home.session_path()));
    EXPECT_EQ(kept.at("email"), account_email);
    EXPECT_EQ(kept.at("service"), base);
    EXPECT_THAT(kept.dump(), Not(HasSubstr("pass")));
}

TEST_F(Emulator, SecretsAreNeverShown)
{
    const std::string log = home.folder().path_of("log");
    const outcome first = sign_in({"--verbose", "--log-file", log});
    const outcome second = home.run({"device-status", "--verbose", "--log-file", log});

    EXPECT_EQ(first.exit_status, 0);
    EXPECT_EQ(second.exit_status, 0);
    const std::string seen = first.out + first.err + second.out + second.err + content_of(log);
    EXPECT_THAT(seen, AllOf(HasSubstr("session_token=(masked)"), HasSubstr("password=(masked)")));
    for (const std::string &secret :
         {token(), std::string(account_password), std::string("a%20pass%20word"),
          std::string("quillmere-development-key")})
        EXPECT_THAT(seen, Not(HasSubstr(secret)));
}

TEST_F(Emulator, ForgottenSessionSendsTheUserToSignIn)
{
    sign_in();
    home.sign_in(base, "0123456789");

    const outcome ended = home.run({"device-status", "--json"});

    EXPECT_EQ(ended.exit_status, 4);
    const auto error = nlohmann::json::parse(ended.out).at("error");
    EXPECT_EQ(error.at("code"), 105);
    EXPECT_EQ(error.at("kind"), "not_signed_in");
}

TEST_F(Emulator, SignedOutMeansSignedOut)
{
    sign_in();

    EXPECT_EQ(home.run({"logout"}).exit_status, 0);
    EXPECT_EQ(home.run({"device-status"}).exit_status, 4);
}

TEST_F(Emulator, RootOfAnotherIsNotTrusted)
{
    const outcome ended = home.run({"limits", "--ca-file", test_root_path()});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_THAT(ended.err, AllOf(HasSubstr("certificate"), HasSubstr(test_root_path())));
}

TEST_F(Emulator, StoppedOneIsSuspected)
{
    const std::string kept = home.folder().write("kept.json", content_of(ready_file));
    EXPECT_EQ(emulator->terminate().exit_status, 0);

    const outcome ended = home.run({"limits", "--emulator", kept, "--retries", "0"});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_THAT(ended.err, HasSubstr("is the emulator still running?"));
}

} // namespace
} // namespace quillmere_test
