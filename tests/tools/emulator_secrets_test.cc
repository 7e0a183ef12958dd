// The secrets of a whole session with the local service: where they are when it is over.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "canaries.h"
#include "emulator_account.h"

namespace quillmere_test {
namespace {

using testing::IsEmpty;
using words = std::vector<std::string>;

class EmulatorSecrets : public emulator_account {
protected:
    const std::string email = "canary@example.org";
    const std::string application_id = "4711";
    const std::string application_key = "Canary5Ak/key+of";
    const std::string facebook_token = "Canary5Fb-token";
    const std::string wrong_password = "Canary5Wp & more";

    EmulatorSecrets()
    {
        add_account(email, facebook_token);
        emulator_command({"add-application", "--id", application_id, "--key-file", "-"},
                         application_key + "\n");
        home.folder().write("app-key", application_key + "\n");
        secrets.add("password", account_password);
        secrets.add("wrong password", wrong_password);
        secrets.add("application key", application_key);
        secrets.add("Facebook token", facebook_token);
        for (const std::string &credentials :
             {email + account_password, email + wrong_password, facebook_token})
            secrets.add("signature", login_signature(credentials, application_id, application_key));
    }

    /** Runs a command with its log on, and takes in what it says. */
    void expect_end(int exit_code, words arguments, const std::string &input = {})
    {
        arguments.insert(arguments.end(), {"--verbose", "--log-file", log});
        const outcome ended = home.run(arguments, input);
        EXPECT_EQ(ended.exit_status, exit_code)
            << testing::PrintToString(arguments) << ended.out << ended.err;
        said_ += ended.out + ended.err;
    }

    void expect_login(int exit_code, words credentials, const std::string &input = {})
    {
        const words application = {"--app-id", application_id, "--app-key-file",
                                   home.folder().path_of("app-key")};
        credentials.insert(credentials.end(), application.begin(), application.end());
        expect_end(exit_code, credentials, input);
    }

    /** Tokens are known once they are there. */
    void add_token_of_the_session(const std::string &name)
    {
        const auto session = nlohmann::json::parse(content_of(home.session_path()));
        secrets.add(name, session.at("session_token"));
    }

    void sign_in_in_every_way();
    void use_account();

    const std::string &said() const { return said_; }

    canaries secrets;
    const std::string log = home.folder().path_of("log");
    const std::string token_file = home.folder().path_of("login-token");

private:
    std::string said_;
};

void EmulatorSecrets::sign_in_in_every_way()
{
    expect_login(3, {"login", email, "--password-stdin"}, wrong_password);
    expect_login(3, {"login-token", email, "--password-stdin", "--token-file", token_file},
                 wrong_password);
    expect_login(0, {"login", "--facebook-token-file", home.folder().path_of("facebook-token")});
    add_token_of_the_session("token by Facebook");
    expect_login(0, {"login", email, "--password-stdin"}, account_password);
    add_token_of_the_session("former token");
    expect_login(0, {"login-token", email, "--password-stdin", "--token-file", token_file},
                 account_password);
    std::string login_token = content_of(token_file);
    login_token.pop_back();
    secrets.add("login token", login_token);
    expect_end(0, {"renew"});
    add_token_of_the_session("token");
}

void EmulatorSecrets::use_account()
{
    const std::string local = home.folder().write("local", "bytes");
    for (const words &each : std::vector<words>{
             {"whoami"},
             {"status"},
             {"limits"},
             {"device-status"},
             {"mkdir", "/folder"},
             {"create", "/empty"},
             {"put", local, "/folder/file"},
             {"update", home.folder().write("revised", "other bytes"), "/folder/file"},
             {"ls", "/folder"},
             {"stat", "/folder/file"},
             {"cp", "/folder/file", "/copy"},
             {"mv", "/copy", "/folder/copy"},
             {"set", "/folder/copy", "--tags", "a"},
             {"links", "/folder/file"},
             {"get", "/folder/file", home.folder().path_of("fetched")},
             {"changes"},
             {"rm", "-r", "/folder"},
         })
        expect_end(0, each);
    for (const char *each : {"stat", "rm", "detach", "attach"})
        expect_end(3, {each, "key:nothing"});
}

// The service keeps digests of passwords and tokens, but the keys of applications themselves, since
// it computes signatures from them.
TEST_F(EmulatorSecrets, AreInTheirFilesAlone)
{
    sign_in_in_every_way();
    use_account();
    const outcome served = emulator->terminate();

    EXPECT_THAT(secrets.in(said()), IsEmpty()) << said();
    EXPECT_THAT(secrets.in(served.out + served.err + served.report), IsEmpty()) << served.err;
    const std::map<std::string, canaries::names> expected = {
        {"app-key", {"application key"}},
        {"facebook-token", {"Facebook token"}},
        {"login-token", {"login token"}},
        {"state/quillmere/session.json", {"token"}},
        {"emulator/store.sqlite", {"application key"}},
    };
    EXPECT_EQ(secrets.in_files_of(home.folder().path()), expected);
}

TEST_F(EmulatorSecrets, AreHiddenWhenTheyNoLongerCount)
{
    expect_login(0, {"login", email, "--password-stdin"}, account_password);
    add_token_of_the_session("former token");
    const std::string former = content_of(home.session_path());
    expect_end(0, {"renew"});
    home.folder().write("state/quillmere/session.json", former);

    for (const words &each : std::vector<words>{{"whoami"}, {"ls"}, {"renew"}, {"rm", "/file"}})
        expect_end(4, each);

    EXPECT_THAT(secrets.in(said() + content_of(log)), IsEmpty()) << said();
}

} // namespace
} // namespace quillmere_test
