// Where colours are used, and where nothing but the text is written.
#include "color.h"

#include <map>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "results.h"
#include "transfers/progress.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::HasSubstr;

class Colors : public testing::Test {
protected:
    bool wanted(color_choice choice, bool is_terminal) const
    {
        return wants_color(choice, surroundings, is_terminal);
    }

    std::map<std::string, std::string> variables{{"TERM", "xterm"}};
    const environment surroundings{[this](const char *name) {
        const auto found = variables.find(name);
        return found == variables.end() ? nullptr : found->second.c_str();
    }};
};

TEST_F(Colors, AreForATerminalUnlessSomebodyChooses)
{
    EXPECT_TRUE(wanted(color_choice::automatic, true));
    EXPECT_FALSE(wanted(color_choice::automatic, false));
    EXPECT_TRUE(wanted(color_choice::always, false));
    EXPECT_FALSE(wanted(color_choice::never, true));
}

TEST_F(Colors, AreLeftOutWhereTheEnvironmentSaysSo)
{
    variables["NO_COLOR"] = "1";

    EXPECT_FALSE(wanted(color_choice::automatic, true));
    EXPECT_TRUE(wanted(color_choice::always, true)) << "the command line goes first";

    variables["NO_COLOR"] = "";
    EXPECT_TRUE(wanted(color_choice::automatic, true)) << "an empty value says nothing";
}

TEST_F(Colors, AreLeftOutOnATerminalThatKnowsNone)
{
    variables["TERM"] = "dumb";
    EXPECT_FALSE(wanted(color_choice::automatic, true));

    variables.erase("TERM");
    EXPECT_FALSE(wanted(color_choice::automatic, true));
}

color_choice choice_in(std::vector<const char *> words)
{
    words.insert(words.begin(), "quillmere");
    return color_choice_in(static_cast<int>(words.size()), words.data());
}

TEST(ColorOption, IsFoundAnywhereAndTheLastOneCounts)
{
    EXPECT_EQ(choice_in({"ls"}), color_choice::automatic);
    EXPECT_EQ(choice_in({"--color", "always", "ls"}), color_choice::always);
    EXPECT_EQ(choice_in({"ls", "--color=never"}), color_choice::never);
    EXPECT_EQ(choice_in({"--color=always", "ls", "--color", "auto"}), color_choice::automatic);
    EXPECT_EQ(choice_in({"ls", "--color"}), color_choice::automatic);
    EXPECT_EQ(choice_in({"ls", "--colorful=always"}), color_choice::automatic);
}

TEST(ColoredTable, MarksHeadingsAndFolders)
{
    const result_table listing = {"entries",
                                  {{"kind", "Kind"}, {"name", "Name"}},
                                  {{{"kind", "Kind", "folder"}, {"name", "Name", "a\x1b"}},
                                   {{"kind", "Kind", "file"}, {"name", "Name", "b"}}}};

    EXPECT_EQ(table_as_text(listing, text_style::colored), "\x1b[1mKind    Name\x1b[0m\n"
                                                           "folder  \x1b[1;34ma\\u{1b}\x1b[0m\n"
                                                           "file    b\n");
}

TEST(ColoredBar, IsAsWideAsAPlainOne)
{
    progress_state state;
    state.name = "a.jpg";
    state.total = 100;
    state.done = 50;

    std::string bar = bar_text(state, 80, bar_color::filled);

    EXPECT_THAT(bar, HasSubstr("[\x1b[32m==="));
    for (const char *code : {"\x1b[32m", "\x1b[0m"})
        bar.erase(bar.find(code), std::string(code).size());
    EXPECT_EQ(bar, bar_text(state, 80));
}

} // namespace
} // namespace quillmere_test
