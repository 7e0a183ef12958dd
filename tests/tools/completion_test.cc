// What shells offer while a command is typed: commands, options, values, and what is in the
// account.
#include <filesystem>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "emulator_account.h"
#include "support/scripted_server.h"
#include "terminal.h"

namespace quillmere_test {
namespace {

using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;
using testing::UnorderedElementsAre;

using lines = std::vector<std::string>;

lines lines_of(const std::string &text)
{
    lines all;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t end = std::min(text.find('\n', at), text.size());
        all.push_back(text.substr(at, end - at));
        at = end + 1;
    }
    return all;
}

class Completion : public emulator_account {
protected:
    Completion()
    {
        // What a person would not wait for a busy machine may well need.
        namespace fs = std::filesystem;
        fs::create_directory(home.folder().path_of("bin"));
        const std::string patient = home.folder().write(
            "bin/quillmere", "#!/bin/sh\nexec '" QUILLMERE_PROGRAM "' --timeout 60 \"$@\"\n");
        fs::permissions(patient, fs::perms::owner_all);
    }

    /** The script for a shell, in a file. */
    std::string script(const std::string &shell) const
    {
        const outcome ended = home.run({"completion", shell});
        EXPECT_EQ(ended.exit_status, 0) << ended.err;
        return home.folder().write("completion." + shell, ended.out);
    }

    command shell(const std::string &name, std::vector<std::string> arguments) const
    {
        command what = home.with({});
        what.program = name;
        what.arguments = std::move(arguments);
        what.folder = home.folder().path();
        what.environment["PATH"] = home.folder().path_of("bin") + ":/usr/bin:/bin";
        return what;
    }

    /** What bash offers for words as it takes them apart; the cursor is behind the last one. */
    lines bash_offers(const lines &words, const std::string &line) const
    {
        lines arguments = {"-c",
                           "source \"$1\"; COMP_LINE=$2; COMP_POINT=${#2}; shift 2; "
                           "COMP_WORDS=(\"$@\"); COMP_CWORD=$(($# - 1)); _quillmere; "
                           "[ ${#COMPREPLY[@]} = 0 ] || printf '%s\\n' \"${COMPREPLY[@]}\"",
                           "bash", script("bash"), line};
        arguments.insert(arguments.end(), words.begin(), words.end());
        const outcome ended = run(shell("bash", arguments));
        EXPECT_EQ(ended.err, "");
        return lines_of(ended.out);
    }

    /** The same for words that bash does not take apart. */
    lines bash_offers(const lines &words) const
    {
        std::string line;
        for (const std::string &each : words)
            line += (line.empty() ? "" : " ") + each;
        return bash_offers(words, line);
    }

    void fill_account() const
    {
        sign_in();
        put_content("/photos/2026/a.jpg", "a");
        put_content("/photos/b c.jpg", "b");
        put_content("/phone.txt", "p");
        put_content("/notes", "n");
    }

    lines remote(const std::string &prefix) const
    {
        const outcome ended = home.run({"--timeout", "60", "__complete", "remote", "--", prefix});
        EXPECT_EQ(ended.err, "");
        return lines_of(ended.out);
    }
};

TEST_F(Completion, OfAPathListsItsFolder)
{
    fill_account();

    EXPECT_THAT(remote("/ph"), UnorderedElementsAre("/photos/", "/phone.txt"));
    EXPECT_THAT(remote("ph"), UnorderedElementsAre("photos/", "phone.txt"));
    EXPECT_THAT(remote("/photos/"), UnorderedElementsAre("/photos/2026/", "/photos/b c.jpg"));
    EXPECT_THAT(remote(""), UnorderedElementsAre("photos/", "phone.txt", "notes"));
    EXPECT_THAT(remote("/photos/x"), IsEmpty());
    EXPECT_THAT(remote("key:" + result_of({"stat", "/photos"}).at("key").get<std::string>() + "/2"),
                Contains(testing::EndsWith("/2026/")));
}

TEST_F(Completion, OfAPathIsSilentWhenSomethingIsWrong)
{
    EXPECT_THAT(remote("/"), IsEmpty()) << "nobody is signed in";

    sign_in();
    for (const char *path : {"/absent/", "/../", "key:a&b/"})
        EXPECT_THAT(remote(path), IsEmpty()) << path;
    home.environment["QUILLMERE_EMULATOR"] = home.folder().path_of("absent");
    EXPECT_THAT(remote("/"), IsEmpty());
    const refused_port closed;
    home.environment["QUILLMERE_EMULATOR"] = std::nullopt;
    home.environment["QUILLMERE_SERVICE"] = closed.base_url("https");
    home.sign_in(closed.base_url("https"), "token");
    EXPECT_THAT(remote("/"), IsEmpty());
}

TEST_F(Completion, IsNotAmongTheCommandsThatPeopleSee)
{
    EXPECT_THAT(home.run({"--help"}).out, AllOf(HasSubstr("completion"), Not(HasSubstr("__"))));
}

TEST_F(Completion, InBashOffersCommandsAndOptions)
{
    EXPECT_THAT(bash_offers({"quillmere", "lo"}),
                UnorderedElementsAre("login", "logout", "login-token"));
    EXPECT_THAT(bash_offers({"quillmere", ""}),
                AllOf(Contains("ls"), Contains("doctor"), Not(Contains("__complete"))));
    EXPECT_THAT(bash_offers({"quillmere", "--profile", "work", "lim"}), ElementsAre("limits"));
    EXPECT_THAT(bash_offers({"quillmere", "set", "--pri"}), ElementsAre("--privacy"));
    EXPECT_THAT(bash_offers({"quillmere", "ls", "--lo"}),
                UnorderedElementsAre("--log-file", "--long"));
}

TEST_F(Completion, InBashOffersValues)
{
    home.configure("[work]\n[profile play]\n");
    home.folder().write("local-file", "");

    EXPECT_THAT(bash_offers({"quillmere", "set", "/a", "--privacy", "p"}),
                UnorderedElementsAre("public", "private"));
    EXPECT_THAT(bash_offers({"quillmere", "links", "--type", "w"}), ElementsAre("watch"));
    EXPECT_THAT(bash_offers({"quillmere", "completion", ""}),
                UnorderedElementsAre("bash", "zsh", "fish"));
    EXPECT_THAT(bash_offers({"quillmere", "--profile", ""}), UnorderedElementsAre("work", "play"));
    EXPECT_THAT(bash_offers({"quillmere", "--ca-file", "local-f"}), ElementsAre("local-file"));
    EXPECT_THAT(bash_offers({"quillmere", "--timeout", ""}), IsEmpty());
    EXPECT_THAT(bash_offers({"quillmere", "--color", "=", "al"}, "quillmere --color=al"),
                ElementsAre("always"));
    EXPECT_THAT(bash_offers({"quillmere", "--color", "="}, "quillmere --color="),
                UnorderedElementsAre("auto", "always", "never"));
}

TEST_F(Completion, InBashOffersWhatIsInTheAccount)
{
    fill_account();
    home.folder().write("photograph", "");
    const auto key = result_of({"stat", "/photos"}).at("key").get<std::string>();

    EXPECT_THAT(bash_offers({"quillmere", "ls", "/pho"}),
                UnorderedElementsAre("/photos/", "/phone.txt"));
    EXPECT_THAT(bash_offers({"quillmere", "rm", "/photos/b\\ "}), ElementsAre("/photos/b c.jpg"));
    EXPECT_THAT(bash_offers({"quillmere", "rm", "\"/photos/b "}, "quillmere rm \"/photos/b "),
                ElementsAre("/photos/b c.jpg"));
    EXPECT_THAT(bash_offers({"quillmere", "put", "pho"}),
                UnorderedElementsAre("photos/", "phone.txt", "photograph"));
    EXPECT_THAT(bash_offers({"quillmere", "ls", "key", ":", key + "/20"},
                            "quillmere ls key:" + key + "/20"),
                ElementsAre(key + "/2026/"))
        << "bash puts it in the place of what stands behind the colon";
    EXPECT_THAT(bash_offers({"quillmere", "limits", "/pho"}), IsEmpty());
}

TEST_F(Completion, InBashRunsNothingThatIsTyped)
{
    fill_account();
    const std::string trap = home.folder().path_of("trap");

    bash_offers({"quillmere", "ls", "$(touch " + trap + ")"});
    bash_offers({"quillmere", "--profile", "`touch " + trap + "`", "ls", "/$(touch " + trap + ")"});

    EXPECT_FALSE(std::filesystem::exists(trap));
}

TEST_F(Completion, InBashLooksIntoTheAccountThatIsMeant)
{
    fill_account();
    home.environment["QUILLMERE_EMULATOR"] = std::nullopt;

    EXPECT_THAT(bash_offers({"quillmere", "--emulator", ready_file, "ls", "/n"}),
                ElementsAre("/notes"));
    EXPECT_THAT(bash_offers({"quillmere", "ls", "--emulator=" + ready_file, "/n"},
                            "quillmere ls --emulator=" + ready_file + " /n"),
                ElementsAre("/notes"));
}

TEST_F(Completion, WorksWhereItIsTypedInBash)
{
    fill_account();
    home.environment["PS1"] = "ready> ";
    terminal_program bash(shell("/bin/bash", {"--norc", "--noprofile", "-i"}));

    bash.wait_for("ready> ");
    bash.type("source " + script("bash") + " && PS1='go''on> '\n");
    bash.wait_for("goon> ");
    bash.type("quillmere ls /photos/b\t");
    bash.wait_for("/photos/b\\ c.jpg");
    bash.type("\x15"
              "exit\n");

    EXPECT_EQ(bash.wait(), 0);
}

TEST_F(Completion, WorksWhereItIsTypedInZsh)
{
    fill_account();
    home.environment["PS1"] = "ready> ";
    terminal_program zsh(shell("/usr/bin/zsh", {"-f", "-i"}));

    zsh.wait_for("ready> ");
    zsh.type("autoload -U compinit && compinit -D -u && source " + script("zsh") +
             " && PS1='go''on> '\n");
    zsh.wait_for("goon> ");
    zsh.type("quillmere ls /photos/b\t");
    zsh.wait_for("/photos/b\\ c.jpg");
    zsh.type("\x15quillmere set /photos --priv\t");
    zsh.wait_for("--privacy");
    zsh.type("\x15"
             "exit\n");

    zsh.wait();
}

TEST_F(Completion, OfZshIsWellFormed)
{
    const outcome ended = run(shell("zsh", {"-n", script("zsh")}));

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_EQ(ended.err, "");
}

class FishCompletion : public Completion {
protected:
    lines offers(const std::string &line) const
    {
        const outcome ended =
            run(shell("fish", {"--no-config", "-c", "source $argv[1]; complete -C $argv[2]",
                               script("fish"), line}));
        EXPECT_EQ(ended.err, "");
        return lines_of(ended.out);
    }
};

TEST_F(FishCompletion, OffersCommandsOptionsAndValues)
{
    home.configure("[work]\n[profile play]\n");

    EXPECT_THAT(offers("quillmere log"),
                UnorderedElementsAre(StartsWith("login\t"), StartsWith("logout\t"),
                                     StartsWith("login-token\t")));
    EXPECT_THAT(offers("quillmere set --pri"), ElementsAre(StartsWith("--privacy\t")));
    EXPECT_THAT(offers("quillmere set /a --privacy p"),
                UnorderedElementsAre(StartsWith("public"), StartsWith("private")));
    EXPECT_THAT(offers("quillmere --profile "),
                UnorderedElementsAre(StartsWith("work"), StartsWith("play")));
    EXPECT_THAT(offers("quillmere --profile work lim"), ElementsAre(StartsWith("limits\t")));
}

TEST_F(FishCompletion, OffersWhatIsInTheAccount)
{
    fill_account();

    EXPECT_THAT(offers("quillmere ls /pho"), UnorderedElementsAre("/photos/", "/phone.txt"));
    EXPECT_THAT(offers("quillmere --emulator " + ready_file + " rm /photos/b"),
                ElementsAre("/photos/b c.jpg"));
}

} // namespace
} // namespace quillmere_test
