// The example for other languages, run as its reader runs it, and shown as it is.
#include <fstream>
#include <sstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "support/process.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;
using testing::Not;

const std::string example = QUILLMERE_SOURCE "/examples/emulator_from_python.py";

std::string text_of(const std::string &path)
{
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}

} // namespace

TEST(EmulatorFromPython, RunsWithTheStandardLibraryAlone)
{
    command what;
    what.program = QUILLMERE_PYTHON;
    // Isolated, and with warnings: of a file or a connection that was left open.
    what.arguments = {"-I", "-W", "always", example};
    what.environment = {{"EMULATOR_PROGRAM", QUILLMERE_EMULATOR}};

    const outcome ended = run(what);

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_THAT(ended.err, HasSubstr("Ran 2 tests"));
    EXPECT_THAT(ended.err, Not(HasSubstr("Warning")));
}

TEST(EmulatorFromPython, FailsWhereTheEmulatorCannotStart)
{
    command what;
    what.program = QUILLMERE_PYTHON;
    what.arguments = {"-I", example};
    what.environment = {{"EMULATOR_PROGRAM", "/nonexistent/emulator"}};

    EXPECT_EQ(run(what).exit_status, 1);
}

TEST(EmulatorFromPython, StandsInItsPageAsItIs)
{
    const std::string page = text_of(QUILLMERE_SOURCE "/docs/emulator-in-tests.md");
    const std::string program = text_of(example);

    ASSERT_NE(program, "");
    EXPECT_THAT(page, HasSubstr("\n```python\n" + program + "```\n"));
}

} // namespace quillmere_test
