// What the command line does with its words, its files and its standard streams.
#include <filesystem>
#include <string>

#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "session_file.h"
#include "support/certificates.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

class Usage : public testing::Test {
protected:
    program_home home;
};

TEST_F(Usage, IsExplainedOnRequest)
{
    const outcome ended = home.run({"--help"});

    EXPECT_EQ(ended.exit_status, 0);
    for (const char *command : {"login",  "logout",     "renew",     "login-token",
                                "whoami", "status",     "limits",    "device-status",
                                "ls",     "stat",       "mkdir",     "create",
                                "rm",     "mv",         "cp",        "set",
                                "links",  "changes",    "attach",    "detach",
                                "doctor", "quickstart", "completion"})
        EXPECT_THAT(ended.out, HasSubstr(command));
    EXPECT_THAT(ended.err, IsEmpty());
}

TEST_F(Usage, OfACommandIsExplainedToo)
{
    const outcome ended = home.run({"login", "--help"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_THAT(ended.out, HasSubstr("--password-stdin"));
}

TEST_F(Usage, HasAVersion)
{
    const outcome ended = home.run({"--version"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_EQ(ended.out, "quillmere " QUILLMERE_VERSION "\n");
}

TEST_F(Usage, IsWrongWithoutACommandOrWithAnUnknownOne)
{
    using words = std::vector<std::string>;
    for (const words &arguments :
         {words{}, words{"frobnicate"}, words{"limits", "--frobnicate"}, words{"limits", "extra"},
          words{"limits", "--timeout", "0"}, words{"limits", "--timeout", "soon"},
          words{"device-status", "--device-id", "4294967296"},
          words{"device-status", "--device-id", "-1"}, words{"limits", "--service", "http://h"},
          words{"limits", "--service", "https://h", "--emulator", "f"},
          words{"login", "a", "--password-stdin", "--password-file", "f"}}) {
        const outcome ended = home.run(arguments);
        EXPECT_EQ(ended.exit_status, 2) << testing::PrintToString(arguments);
        EXPECT_THAT(ended.err, StartsWith("quillmere: ")) << testing::PrintToString(arguments);
        EXPECT_THAT(ended.out, IsEmpty());
    }
}

TEST_F(Usage, OfACommandOnTheAccountIsWrongBeforeAnythingIsAsked)
{
    using words = std::vector<std::string>;
    home.environment["SSL_CERT_FILE"] = test_root_path();
    home.sign_in("https://127.0.0.1:1", "token"); // where there is no answer, which is another code
    for (const words &arguments : {words{"whoami", "extra"},
                                   words{"ls", "/a", "/b"},
                                   words{"ls", ""},
                                   words{"ls", "/.."},
                                   words{"ls", "key:a&b"},
                                   words{"stat"},
                                   words{"mkdir"},
                                   words{"mkdir", "/a", "--depth"},
                                   words{"create"},
                                   words{"rm"},
                                   words{"rm", "-r"},
                                   words{"rm", "/"},
                                   words{"mv", "/a"},
                                   words{"mv", "/", "/a"},
                                   words{"cp", "/a"},
                                   words{"cp", "-r", "/", "/a"},
                                   words{"set", "/a"},
                                   words{"set", "/", "--tags", "x"},
                                   words{"set", "/a", "--name", ""},
                                   words{"set", "/a", "--time", ""},
                                   words{"set", "/a", "--privacy", "secret"},
                                   words{"set", "/a", "--tags", "x", "--recursive"},
                                   words{"set", "--tags", "x"},
                                   words{"links"},
                                   words{"links", "/a", "--type", "hidden"},
                                   words{"links", "/a", "--type", "view", "--download"},
                                   words{"changes", "--since", "-1"},
                                   words{"changes", "--since", "18446744073709551616"},
                                   words{"changes", "--since", "010"},
                                   words{"changes", "--since", "1", "--sample"},
                                   words{"changes", "--device", "4294967296"},
                                   words{"attach"},
                                   words{"attach", "/a"},
                                   words{"attach", "key:a/b"},
                                   words{"detach"},
                                   words{"login-token", "a@b"}}) {
        const outcome ended = home.run(arguments);
        EXPECT_EQ(ended.exit_status, 2) << testing::PrintToString(arguments) << ended.err;
        EXPECT_THAT(ended.err, StartsWith("quillmere: ")) << testing::PrintToString(arguments);
        EXPECT_THAT(ended.out, IsEmpty());
    }
}

TEST_F(Usage, OfTheAccountNeedsASession)
{
    using words = std::vector<std::string>;
    for (const words &arguments :
         {words{"renew"}, words{"whoami"}, words{"ls"}, words{"stat", "/"}, words{"mkdir", "/a"},
          words{"create", "/a"}, words{"rm", "/a"}, words{"mv", "/a", "/b"},
          words{"cp", "/a", "/b"}, words{"set", "/a", "--tags", "x"}, words{"links", "/a"},
          words{"changes"}, words{"attach", "key:a"}, words{"detach", "key:a"}}) {
        words in_json = arguments;
        in_json.emplace_back("--json");
        const outcome ended = home.run(in_json);
        EXPECT_EQ(ended.exit_status, 4) << testing::PrintToString(arguments);
        EXPECT_EQ(nlohmann::json::parse(ended.out).at("error").at("kind"), "not_signed_in");
    }
}

TEST_F(Usage, OfTheSampleFeedNeedsNothing)
{
    const outcome ended = home.run({"changes", "--sample", "--json"});

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    const auto document = nlohmann::json::parse(ended.out);
    EXPECT_EQ(document.at("device_revision"), 59);
    EXPECT_EQ(document.at("changes").size(), 17U);
    EXPECT_EQ(document.at("changes").at(0).at("change"), "updated");
    EXPECT_EQ(document.at("changes").at(16).at("kind"), "folder");
}

TEST_F(Usage, IsWrongInJsonToo)
{
    const outcome ended = home.run({"frobnicate", "--json"});

    EXPECT_EQ(ended.exit_status, 2);
    EXPECT_EQ(nlohmann::json::parse(ended.out).at("error").at("kind"), "usage");
    EXPECT_THAT(ended.err, IsEmpty());
}

TEST_F(Usage, NeedsAnApplicationToSignIn)
{
    EXPECT_EQ(home.run({"login", "a@b", "--password-stdin"}, "p").exit_status, 2);
    EXPECT_EQ(home.run({"login", "a@b", "--password-stdin", "--app-id", "1"}, "p").exit_status, 2);
}

TEST_F(Usage, OfAnEmptyPasswordIsRefused)
{
    home.environment["QUILLMERE_APP_ID"] = "1";
    home.environment["QUILLMERE_APP_KEY"] = "k";

    EXPECT_EQ(home.run({"login", "a@b", "--password-stdin"}, "\n").exit_status, 9);
}

TEST_F(Usage, OfSigningOutNeedsNoService)
{
    home.sign_in("https://h", "token");

    const outcome first = home.run({"logout"});
    const outcome second = home.run({"logout", "--json"});

    EXPECT_EQ(first.exit_status, 0);
    EXPECT_EQ(first.out, "Signed out\n");
    EXPECT_FALSE(std::filesystem::exists(home.session_path()));
    EXPECT_EQ(second.exit_status, 0);
    EXPECT_EQ(nlohmann::json::parse(second.out).at("signed_out"), false);
}

TEST_F(Usage, OfADamagedSessionFileIsToldOnlyWhereItMatters)
{
    home.sign_in("https://h", "token");
    home.folder().write("state/quillmere/session.json", "{");

    EXPECT_EQ(home.run({"device-status"}).exit_status, 9);
    EXPECT_EQ(home.run({"logout"}).exit_status, 0);
}

TEST_F(Usage, OfAProfileReplacesOptions)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(xml_reply("<response><result>Success</result></response>"));
    home.configure("[work]\nservice = " + server.base_url() + "\nca_file = " + test_root_path() +
                   "\n");

    EXPECT_EQ(home.run({"limits", "--profile", "work"}).exit_status, 0);
    home.environment["QUILLMERE_PROFILE"] = "work";
    EXPECT_EQ(home.run({"limits"}).exit_status, 0);
    EXPECT_EQ(home.run({"limits", "--profile", "play"}).exit_status, 9);
    EXPECT_EQ(server.connections(), 2U);
}

TEST_F(Usage, OfASessionFileKeepsSessionsApart)
{
    home.configure("[work]\nsession_file = " + home.folder().path_of("elsewhere/work") + "\n");
    std::filesystem::create_directory(home.folder().path_of("elsewhere"));
    ASSERT_EQ(::chmod(home.folder().path_of("elsewhere").c_str(), 0755), 0);
    const quillmere::tools::session_file kept(home.folder().path_of("elsewhere/work"),
                                              quillmere::tools::folder_owner::somebody);
    kept.save({"https://work", "", "token"});
    home.sign_in("https://h", "token");

    EXPECT_EQ(home.run({"logout", "--profile", "work"}).out, "Signed out\n");

    EXPECT_FALSE(std::filesystem::exists(kept.path()));
    EXPECT_TRUE(std::filesystem::exists(home.session_path()));
    struct stat facts = {};
    ASSERT_EQ(::stat(home.folder().path_of("elsewhere").c_str(), &facts), 0);
    EXPECT_EQ(facts.st_mode & 0777U, 0755U) << "a folder of others stays as it is";
}

TEST_F(Usage, OfAProxyLeadsThere)
{
    const refused_port proxy;
    home.environment["SSL_CERT_FILE"] = test_root_path();
    const std::string address = proxy.base_url();
    home.configure("[work]\nproxy = " + address + "\n");

    for (const std::vector<std::string> &words :
         {std::vector<std::string>{"--proxy", address}, {"--profile", "work"}}) {
        std::vector<std::string> arguments = {"limits", "--service", "https://nowhere.invalid",
                                              "--retries", "0"};
        arguments.insert(arguments.end(), words.begin(), words.end());
        const outcome ended = home.run(arguments);
        EXPECT_EQ(ended.exit_status, 5);
        EXPECT_THAT(ended.err, HasSubstr(address.substr(address.rfind(':') + 1)))
            << "the port of the proxy, which refuses";
    }
}

TEST_F(Usage, OfALogFileKeepsItPrivate)
{
    const std::string log = home.folder().write("log", "before\n");
    ASSERT_EQ(::chmod(log.c_str(), 0644), 0);

    home.run({"logout", "--log-file", log});

    struct stat facts = {};
    ASSERT_EQ(::stat(log.c_str(), &facts), 0);
    EXPECT_EQ(facts.st_mode & 0777U, 0600U);
    EXPECT_THAT(content_of(log), StartsWith("before\n"));
}

TEST_F(Usage, OfALogFileThatCannotBeOpenedFails)
{
    EXPECT_EQ(home.run({"logout", "--log-file", home.folder().path()}).exit_status, 9);
}

TEST_F(Usage, OfAStandardOutputThatTakesNothingFails)
{
    command full;
    full.program = "sh";
    full.arguments = {"-c", "\"$0\" --version >/dev/full; echo $?; \"$0\" --version >&-; echo $?",
                      QUILLMERE_PROGRAM};

    const outcome ended = run(full);

    EXPECT_EQ(ended.out, "9\n9\n");
    EXPECT_THAT(ended.err, AllOf(HasSubstr("cannot write to standard output"),
                                 HasSubstr("No space left on device")));
}

} // namespace
} // namespace quillmere_test
