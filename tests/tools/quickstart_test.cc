// The first look: that it works without anything else, that what it shows can be typed, and that it
// leaves nothing behind.
#include <csignal>
#include <filesystem>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

class Quickstart : public testing::Test {
protected:
    Quickstart()
    {
        fs::create_directory(scratch);
        home.environment["TMPDIR"] = scratch;
    }

    std::vector<std::string> left_behind() const
    {
        std::vector<std::string> names;
        for (const auto &each : fs::recursive_directory_iterator(scratch))
            names.push_back(each.path());
        return names;
    }

    /** Whether a program runs whose arguments name the scratch folder. */
    bool is_anything_running() const
    {
        for (const auto &each : fs::directory_iterator("/proc")) {
            std::error_code gone;
            if (!fs::exists(each.path() / "cmdline", gone))
                continue;
            try {
                if (content_of((each.path() / "cmdline").string()).find(scratch) !=
                    std::string::npos)
                    return true;
            } catch (const std::exception &) {
                continue; // it has ended meanwhile
            }
        }
        return false;
    }

    program_home home;
    const std::string scratch = home.folder().path_of("scratch");
};

TEST_F(Quickstart, SendsAFileAndBringsItBackWhole)
{
    const outcome ended = home.run({"quickstart"});

    EXPECT_EQ(ended.exit_status, 0) << ended.out << ended.err;
    EXPECT_THAT(ended.out, AllOf(StartsWith("$ work=$(mktemp -d)\n"),
                                 HasSubstr("\n$ quillmere login ada@example.com --password-file "
                                           "$work/password\nSigned in to https://127.0.0.1:"),
                                 HasSubstr("hello.txt\n"), HasSubstr("The file came back whole")));
    EXPECT_THAT(left_behind(), IsEmpty());
    EXPECT_FALSE(is_anything_running());
    EXPECT_FALSE(fs::exists(home.session_path()));
}

TEST_F(Quickstart, IsNotLedElsewhereByTheEnvironment)
{
    home.environment["QUILLMERE_SERVICE"] = "https://service.example";
    home.environment["SSL_CERT_FILE"] = home.folder().path_of("absent");
    home.environment["https_proxy"] = "http://127.0.0.1:1";
    home.sign_in("https://service.example", "token");

    const outcome ended = home.run({"quickstart"});

    EXPECT_EQ(ended.exit_status, 0) << ended.out << ended.err;
    EXPECT_THAT(ended.out, HasSubstr("$ unset QUILLMERE_SERVICE SSL_CERT_FILE\n"));
    EXPECT_TRUE(fs::exists(home.session_path())) << "another session stays";
}

TEST_F(Quickstart, IsToldToScripts)
{
    const outcome ended = home.run({"quickstart", "--json"});

    const auto document = nlohmann::json::parse(ended.out);
    EXPECT_EQ(document.at("sha256").get<std::string>().size(), 64U);
    EXPECT_EQ(document.at("commands").at(0), "work=$(mktemp -d)");
}

// A person may type what is shown. The service takes a moment to start, which is what the loop is
// for.
TEST_F(Quickstart, ShowsCommandsThatWork)
{
    std::string script = "set -e\n";
    const auto document = nlohmann::json::parse(home.run({"quickstart", "--json"}).out);
    for (const auto &each : document.at("commands")) {
        const auto line = each.get<std::string>();
        script += line + "\n";
        if (line.back() == '&')
            script += "until [ -e $work/ready.json ]; do sleep 0.05; kill -0 $!; done\n";
    }
    command shell;
    shell.program = "bash";
    shell.arguments = {"-c", script};
    shell.environment = home.environment;
    shell.environment["PATH"] = fs::path(QUILLMERE_PROGRAM).parent_path().string() + ":" +
                                fs::path(QUILLMERE_EMULATOR).parent_path().string() +
                                ":/usr/bin:/bin";

    const outcome ended = run(shell);

    EXPECT_EQ(ended.exit_status, 0) << script << ended.out << ended.err;
    EXPECT_THAT(ended.out, HasSubstr(document.at("sha256").get<std::string>()));
    EXPECT_THAT(left_behind(), IsEmpty());
}

class InterruptedQuickstart : public Quickstart, public testing::WithParamInterface<int> {};

TEST_P(InterruptedQuickstart, LeavesNothingBehind)
{
    for (const char *moment : {"add-account", "--ready-file", "mkdir", "sha256sum"}) {
        process running(home.with({"quickstart"}));
        running.wait_for_line(channel::out, moment);

        running.send_signal(GetParam());
        const outcome ended = running.wait();

        if (ended.exit_status == 0) {
            SUCCEED() << "it was done already";
        } else if (GetParam() == SIGINT) {
            EXPECT_EQ(ended.exit_status, 130) << moment << ended.err;
        } else {
            EXPECT_EQ(ended.signal, GetParam()) << moment << ended.err;
        }
        EXPECT_THAT(left_behind(), IsEmpty()) << moment;
        EXPECT_FALSE(is_anything_running()) << moment;
    }
}

INSTANTIATE_TEST_SUITE_P(Signals, InterruptedQuickstart, testing::Values(SIGINT, SIGTERM, SIGHUP));

TEST_F(Quickstart, SaysWhatIsMissing)
{
    // A copy elsewhere has no emulator beside it.
    const std::string copy = home.folder().path_of("quillmere");
    fs::copy_file(QUILLMERE_PROGRAM, copy);
    command alone = home.with({"quickstart"});
    alone.program = copy;
    alone.environment["PATH"] = scratch;
    alone.environment["LD_LIBRARY_PATH"] = QUILLMERE_LIBRARY_FOLDER;

    const outcome ended = run(alone);

    EXPECT_EQ(ended.exit_status, 9);
    EXPECT_EQ(ended.err, "quillmere: quillmere-emulator is not on this machine (install it, beside "
                         "quillmere or in a folder of PATH)\n");
    EXPECT_THAT(left_behind(), IsEmpty());
}

TEST_F(Quickstart, SaysThatThereIsNoRoom)
{
    home.environment["TMPDIR"] = home.folder().path_of("absent");

    EXPECT_EQ(home.run({"quickstart"}).exit_status, 9);
}

} // namespace
} // namespace quillmere_test
