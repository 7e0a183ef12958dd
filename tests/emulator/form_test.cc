#include "form.h"

#include <string>

#include <gtest/gtest.h>

#include "errors.h"

using namespace emulator;

namespace {

parameters read_form(std::string_view form)
{
    parameters read;
    add_form_parameters(form, read);
    return read;
}

} // namespace

TEST(FormText, DecodesEscapesOfEitherCaseAndBlanks)
{
    EXPECT_EQ(decode_form_text("a%26b%3d+%C3%bc!()*^"), "a&b= \xc3\xbc!()*^");
}

TEST(FormText, DecodesEveryEscapeThatIsText)
{
    for (int byte = 0x20; byte < 0x80; ++byte) {
        char escape[4];
        std::snprintf(escape, sizeof escape, "%%%02x", byte);

        EXPECT_EQ(decode_form_text(escape), std::string(1, static_cast<char>(byte)));
    }
}

TEST(FormText, RefusesABrokenEscape)
{
    for (const char *text : {"%", "a%", "%4", "a%4", "%zz", "%4z", "%z4", "%%41", "%-1"})
        EXPECT_THROW(decode_form_text(text), refusal) << text;
}

TEST(FormText, RefusesWhatNoReplyCouldCarry)
{
    for (const char *text : {"%00", "%01", "%ff", "%c3", "\xff", "%ed%a0%80"})
        EXPECT_THROW(decode_form_text(text), refusal) << text;
}

TEST(FormText, SaysWhatIsWrongWithoutTheValue)
{
    try {
        decode_form_text("secret%zz");
        FAIL();
    } catch (const refusal &why) {
        EXPECT_EQ(why.number(), error::malformed_request);
        EXPECT_STREQ(why.what(), "Malformed request: a percent sign without two hexadecimal "
                                 "digits in a parameter");
    }
}

TEST(FormParameters, ReadPairs)
{
    EXPECT_EQ(read_form("a=1&b=x%3Dy&c=&d"),
              (parameters{{"a", "1"}, {"b", "x=y"}, {"c", ""}, {"d", ""}}));
}

TEST(FormParameters, SplitAPairAtItsFirstEqualsSign)
{
    EXPECT_EQ(read_form("a=b=c"), (parameters{{"a", "b=c"}}));
}

TEST(FormParameters, SkipEmptyPairs) { EXPECT_EQ(read_form("&a=1&&b=2&"), read_form("a=1&b=2")); }

TEST(FormParameters, RefuseANameThatComesTwice) { EXPECT_THROW(read_form("a=1&%61=1"), refusal); }
