// Results for people and for scripts.
#include "results.h"

#include <gtest/gtest.h>

#include "text.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;

const std::vector<fact> facts = {{"a", "Short", "x\x1b[1m"}, {"b", "Much longer", 7},
                                 {"c", "Yes", true},         {"d", "No", false},
                                 {"e", "Absent", nullptr},   {"f", "\xc3\xa4", "\xc3\xa4"}};

TEST(Results, AreAlignedForPeople)
{
    EXPECT_EQ(facts_as_text(facts, text_style::terminal), "Short        x\\u{1b}[1m\n"
                                                          "Much longer  7\n"
                                                          "Yes          yes\n"
                                                          "No           no\n"
                                                          "Absent       -\n"
                                                          "\xc3\xa4            \xc3\xa4\n");
}

TEST(Results, KeepTheirBytesWhereThereIsNoTerminal)
{
    EXPECT_EQ(facts_as_text({{"a", "A", "x\x1b[1m"}}, text_style::plain), "A  x\x1b[1m\n");
}

TEST(Results, AreOneObjectForScripts)
{
    const auto document = nlohmann::ordered_json::parse(facts_as_json(facts));

    EXPECT_EQ(document.dump(), "{\"a\":\"x\\u001b[1m\",\"b\":7,\"c\":true,\"d\":false,\"e\":null,"
                               "\"f\":\"\xc3\xa4\"}");
}

TEST(Results, AreAsciiInJson)
{
    for (const char letter : facts_as_json({{"a", "A", "\xc2\x9b\x7f\xff\xe2\x80\xae"}}))
        EXPECT_TRUE(letter == '\n' || static_cast<unsigned char>(letter - ' ') < 0x60)
            << int{letter};
}

TEST(Results, ForScriptsAloneAreNotShownToPeople)
{
    const std::vector<fact> hidden = {{"a", nullptr, 1}, {"b", "B", 2}};

    EXPECT_EQ(facts_as_text(hidden, text_style::plain), "B  2\n");
    EXPECT_EQ(nlohmann::json::parse(facts_as_json(hidden)).size(), 2U);
}

TEST(ResultGroups, LeaveOutWhatIsNotKnown)
{
    const std::vector<fact_group> groups = {
        {"one", {{"a", "A", "x"}, {"b", "Nothing", nullptr}, {"c", "Empty", ""}}},
        {"two", {{"a", "Again", 0}, {"d", "No", false}}}};

    EXPECT_EQ(groups_as_text(groups, text_style::plain), "A      x\nAgain  0\nNo     no\n");
}

TEST(ResultGroups, AreObjectsForScripts)
{
    const auto document = nlohmann::ordered_json::parse(
        groups_as_json({{"one", {{"a", "A", "x"}, {"b", "B", nullptr}}}, {"two", {}}}));

    EXPECT_EQ(document.dump(), R"({"one":{"a":"x","b":null},"two":{}})");
}

const result_table files = {
    "files",
    {{"size", "Size"}, {"key", "Key"}, {"name", "Name"}},
    {{{"name", nullptr, "a\x1b  "}, {"size", nullptr, 1000000}, {"more", nullptr, true}},
     {{"key", nullptr, "k"}, {"name", nullptr, "b"}, {"size", nullptr, 5}}}};

TEST(ResultTables, HaveHeadingsAndNumbersToTheRight)
{
    EXPECT_EQ(table_as_text(files, text_style::terminal), "   Size  Key  Name\n"
                                                          "1000000  -    a\\u{1b}  \n"
                                                          "      5  k    b\n");
    EXPECT_EQ(table_as_text(files, text_style::plain).find("a\x1b  \n"), 33U);
}

TEST(ResultTables, TakeAColumnWithOneTextToTheLeft)
{
    result_table mixed = {"rows", {{"a", "A"}, {"b", "B"}}, {}};
    mixed.rows = {{{"a", nullptr, 1000}, {"b", nullptr, 1}}, {{"a", nullptr, "x"}}};

    EXPECT_EQ(table_as_text(mixed, text_style::plain), "A     B\n1000  1\nx     -\n");
}

TEST(ResultTables, WithoutRowsShowNothing)
{
    EXPECT_EQ(table_as_text({"rows", {{"a", "A"}}, {}}, text_style::plain), "");
    EXPECT_EQ(nlohmann::json::parse(table_as_json({}, {"rows", {}, {}})).dump(), R"({"rows":[]})");
}

TEST(ResultTables, AreArraysOfWholeObjectsForScripts)
{
    const auto document =
        nlohmann::ordered_json::parse(table_as_json({{"about", "About", 3}}, files));

    EXPECT_EQ(document.dump(), R"({"about":3,"files":[)"
                               R"({"name":"a\u001b  ","size":1000000,"more":true},)"
                               R"({"key":"k","name":"b","size":5}]})");
}

TEST(Numbers, AreNumbersOnlyWhenWrittenAsSuch)
{
    EXPECT_EQ(number_or_text("0"), 0);
    EXPECT_EQ(number_or_text("18446744073709551615"), 18446744073709551615U);
    EXPECT_EQ(number_or_text("18446744073709551616"), "18446744073709551616");
    for (const char *text : {"", "-1", "1.5", "007", "12 ", "0x1", "OK"})
        EXPECT_EQ(number_or_text(text), text);
    EXPECT_TRUE(number_or_text(nullptr).is_null());
}

TEST(Numbers, AreReadWholeOrNotAtAll)
{
    EXPECT_EQ(decimal_number("0"), 0U);
    EXPECT_EQ(decimal_number("18446744073709551615"), 18446744073709551615U);
    for (const char *text : {"18446744073709551616", "", "-1", "+1", " 1", "1 ", "010", "0x1"})
        EXPECT_EQ(decimal_number(text), std::nullopt) << text;
}

TEST(Escaping, WritesOutWhatATerminalWouldObey)
{
    EXPECT_EQ(escape_controls("a\tb\nc\rd\x7f"), "a\\tb\\nc\\u{d}d\\u{7f}");
    EXPECT_EQ(escape_controls("\xc2\x9b \xe2\x80\xae \xe2\x81\xa6 \xe2\x80\xa8"),
              "\\u{9b} \\u{202e} \\u{2066} \\u{2028}");
    EXPECT_EQ(escape_controls(std::string_view("\0", 1)), "\\u{0}");
}

TEST(Escaping, LeavesWritingAlone)
{
    const std::string text = "plain \\ \xc3\xa4 \xe6\x97\xa5 \xf0\x9f\x98\x80";

    EXPECT_EQ(escape_controls(text), text);
}

TEST(Escaping, WritesOutBytesThatAreNoText)
{
    EXPECT_EQ(escape_controls("\xff\xc3"), "\\xff\\xc3");
    EXPECT_EQ(escape_controls("\xc0\xaf"), "\\xc0\\xaf");
    EXPECT_EQ(escape_controls("\xed\xa0\x80"), "\\xed\\xa0\\x80");
    EXPECT_EQ(escape_controls("\xe2\x80"), "\\xe2\\x80");
    EXPECT_EQ(escape_controls("\xf4\x90\x80\x80"), "\\xf4\\x90\\x80\\x80");
}

} // namespace
} // namespace quillmere_test
