// The examples of the man page, run as they stand there, one after another.
#include <filesystem>
#include <sstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "emulator_account.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::Contains;
using testing::HasSubstr;

/** The lines of the examples, which stand between marks of their own. */
std::vector<std::string> examples()
{
    std::vector<std::string> lines;
    std::istringstream page(content_of(QUILLMERE_MANUAL));
    bool in_examples = false;
    bool in_code = false;
    for (std::string line; std::getline(page, line);) {
        if (line.substr(0, 2) == "# ")
            in_examples = line == "# EXAMPLES";
        else if (line == "```")
            in_code = !in_code;
        else if (in_examples && in_code)
            lines.push_back(line);
    }
    return lines;
}

class Manual : public emulator_account {
protected:
    Manual()
    {
        // What the examples take for granted.
        add_account("ada@example.com");
        add_account("bob@example.com");
        home.folder().write("password", std::string(account_password) + "\n");
        fs::create_directory(home.folder().path_of("photos"));
        home.folder().write("photos/a.jpg", "not quite a picture\n");
    }

    command shell(const std::string &script) const
    {
        command what = home.with({});
        what.program = "bash";
        what.arguments = {"-c", script};
        what.folder = home.folder().path();
        for (const char *variable : {"QUILLMERE_EMULATOR", "XDG_CONFIG_HOME", "XDG_STATE_HOME"})
            what.environment[variable] = std::nullopt;
        what.environment["PATH"] = fs::path(QUILLMERE_PROGRAM).parent_path().string() + ":" +
                                   fs::path(QUILLMERE_EMULATOR).parent_path().string() +
                                   ":/usr/bin:/bin";
        return what;
    }
};

TEST_F(Manual, ShowsExamplesThatWork)
{
    std::string script = "set -e -o pipefail\n";
    for (const std::string &line : examples())
        script += "echo \"+ $LINENO\" >&2\n" + line + "\n";

    const outcome ended = run(shell(script));

    EXPECT_EQ(ended.exit_status, 0) << script << ended.out << ended.err;
    EXPECT_EQ(content_of(home.folder().path_of("backup/a.jpg")), "not quite a picture\n");
    EXPECT_THAT(ended.out, HasSubstr("ok       api"));
    EXPECT_FALSE(fs::exists(home.folder().path_of(".local/state/quillmere/session.json")));
    EXPECT_TRUE(fs::exists(home.folder().path_of(".local/state/quillmere/work.json")));
}

TEST_F(Manual, ShowsExamplesOfMostCommands)
{
    const std::vector<std::string> lines = examples();

    for (const char *command : {"put", "get", "ls", "mv", "cp", "rm", "login", "doctor", "changes"})
        EXPECT_THAT(lines, Contains(HasSubstr(std::string("quillmere ") + command))) << command;
}

} // namespace
} // namespace quillmere_test
