// What of the program's output is coloured, and when.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "program.h"
#include "terminal.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

constexpr const char *red_name = "\x1b[1;31mquillmere:\x1b[0m ";

class ColoredProgram : public testing::Test {
protected:
    std::string shown(const std::vector<std::string> &arguments) const
    {
        terminal_program program(home.with(arguments));
        EXPECT_NE(program.wait(), -1);
        return program.shown();
    }

    program_home home;
};

TEST_F(ColoredProgram, MarksAFailureOnATerminal)
{
    home.environment["TERM"] = "xterm";

    EXPECT_THAT(shown({"whoami"}), StartsWith(red_name));
    EXPECT_THAT(shown({"whoami", "--color", "never"}), StartsWith("quillmere: "));
    EXPECT_THAT(shown({"whoami", "--json"}), Not(HasSubstr("\x1b")));
    home.environment["NO_COLOR"] = "1";
    EXPECT_THAT(shown({"whoami"}), StartsWith("quillmere: "));
}

TEST_F(ColoredProgram, MarksNothingElsewhereUnlessTold)
{
    home.environment["TERM"] = "xterm";

    EXPECT_THAT(home.run({"whoami"}).err, StartsWith("quillmere: "));
    EXPECT_THAT(home.run({"whoami", "--color", "always"}).err, StartsWith(red_name));
    EXPECT_THAT(home.run({"frobnicate", "--color=always"}).err, StartsWith(red_name));
    EXPECT_THAT(home.run({"--color", "always", "whoami", "--json"}).out, Not(HasSubstr("\x1b")));
}

TEST_F(ColoredProgram, MarksHeadings)
{
    const outcome colored = home.run({"changes", "--sample", "--color", "always"});
    const outcome plain = home.run({"changes", "--sample"});

    EXPECT_THAT(colored.out, HasSubstr("\x1b[1mRevision"));
    EXPECT_THAT(plain.out, Not(HasSubstr("\x1b")));
}

TEST_F(ColoredProgram, RefusesAnotherChoice)
{
    EXPECT_EQ(home.run({"whoami", "--color", "purple"}).exit_status, 2);
}

} // namespace
} // namespace quillmere_test
