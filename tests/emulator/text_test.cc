#include "text.h"

#include <limits>
#include <ostream>
#include <string>

#include <gtest/gtest.h>

using emulator::is_xml_text;
using emulator::parse_decimal;

namespace {

struct text_case {
    const char *name;
    std::string text;
    bool fits;
};

// Without it the framework prints the bytes of the case, addresses among them, into test names.
void PrintTo(const text_case &what, std::ostream *to) { *to << what.name; }

class XmlText : public testing::TestWithParam<text_case> {};

std::string name_of(const testing::TestParamInfo<text_case> &info) { return info.param.name; }

} // namespace

TEST_P(XmlText, IsJudgedByItsCharacters)
{
    EXPECT_EQ(is_xml_text(GetParam().text), GetParam().fits);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, XmlText,
    testing::Values(
        text_case{"Nothing", "", true}, text_case{"Plain", "plain", true},
        text_case{"Blanks", "\t\r\n", true}, text_case{"Nul", std::string(1, '\0'), false},
        text_case{"LastControl", "\x1f", false}, text_case{"Delete", "\x7f", true},
        text_case{"TwoBytes", "\xc3\xbc", true}, text_case{"ThreeBytes", "\xe2\x82\xac", true},
        text_case{"FourBytes", "\xf0\x9f\x98\x80", true},
        text_case{"LoneContinuation", "\x80", false}, text_case{"CutOff", "\xc3", false},
        text_case{"NoContinuation", "\xc3\x28", false}, text_case{"OverlongTwo", "\xc0\xaf", false},
        text_case{"OverlongThree", "\xe0\x80\xaf", false},
        text_case{"OverlongFour", "\xf0\x80\x80\xaf", false},
        text_case{"BeforeSurrogates", "\xed\x9f\xbf", true},
        text_case{"Surrogate", "\xed\xa0\x80", false},
        text_case{"BehindSurrogates", "\xee\x80\x80", true},
        text_case{"BeforeNoncharacters", "\xef\xbf\xbd", true},
        text_case{"FirstNoncharacter", "\xef\xbf\xbe", false},
        text_case{"SecondNoncharacter", "\xef\xbf\xbf", false},
        text_case{"LastCharacter", "\xf4\x8f\xbf\xbf", true},
        text_case{"BeyondUnicode", "\xf4\x90\x80\x80", false},
        text_case{"FiveBytes", "\xf8\x88\x80\x80\x80", false}, text_case{"NoLead", "\xff", false}),
    name_of);

TEST(Decimal, IsDigitsAlone)
{
    constexpr std::uint64_t any = std::numeric_limits<std::uint64_t>::max();

    EXPECT_EQ(parse_decimal("0", any), 0u);
    EXPECT_EQ(parse_decimal("18446744073709551615", any), any);
    for (const char *text : {"", " 1", "1 ", "+1", "-1", "0x1", "1a", "18446744073709551616"})
        EXPECT_FALSE(parse_decimal(text, any)) << text;
}

TEST(Decimal, HasALargestValue)
{
    EXPECT_EQ(parse_decimal("4294967295", 4294967295u), 4294967295u);
    EXPECT_FALSE(parse_decimal("4294967296", 4294967295u));
}
