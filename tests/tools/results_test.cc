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
    EXPECT_EQ(facts_as_text(facts, true), "Short        x\\u{1b}[1m\n"
                                          "Much longer  7\n"
                                          "Yes          yes\n"
                                          "No           no\n"
                                          "Absent       -\n"
                                          "\xc3\xa4            \xc3\xa4\n");
}

TEST(Results, KeepTheirBytesWhereThereIsNoTerminal)
{
    EXPECT_EQ(facts_as_text({{"a", "A", "x\x1b[1m"}}, false), "A  x\x1b[1m\n");
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

TEST(Numbers, AreNumbersOnlyWhenWrittenAsSuch)
{
    EXPECT_EQ(number_or_text("0"), 0);
    EXPECT_EQ(number_or_text("18446744073709551615"), 18446744073709551615U);
    EXPECT_EQ(number_or_text("18446744073709551616"), "18446744073709551616");
    for (const char *text : {"", "-1", "1.5", "007", "12 ", "0x1", "OK"})
        EXPECT_EQ(number_or_text(text), text);
    EXPECT_TRUE(number_or_text(nullptr).is_null());
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
