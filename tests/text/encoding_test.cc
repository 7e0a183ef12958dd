// Percent-encoding.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "quillmere.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

bool passes_by_the_rule(int byte)
{
    static const std::string unencoded = "abcdefghijklmnopqrstuvwxyz"
                                         "ABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                         "0123456789"
                                         "!()*^";
    return byte != 0 && unencoded.find(static_cast<char>(byte)) != std::string::npos;
}

TEST(AcceptableLetter, IsALetterADigitOrOneOfFiveMarks)
{
    for (int byte = 0; byte < 256; ++byte)
        EXPECT_EQ(url_acceptable_letter(byte), passes_by_the_rule(byte) ? 1 : 0) << byte;
}

TEST(AcceptableLetter, CountsByItsLowEightBits)
{
    for (int byte = 0; byte < 256; ++byte) {
        int32_t expected = passes_by_the_rule(byte) ? 1 : 0;
        EXPECT_EQ(url_acceptable_letter(byte + 0x100), expected) << byte;
        EXPECT_EQ(url_acceptable_letter(byte - 0x100), expected) << byte;
        EXPECT_EQ(url_acceptable_letter(byte | 0x7fffff00), expected) << byte;
    }
}

TEST(EncodedAppend, WritesEveryByteAsItIsOrAsTwoHexadecimalDigits)
{
    for (int byte = 1; byte < 256; ++byte) {
        std::string text(1, static_cast<char>(byte));
        char encoded[4];
        std::snprintf(encoded, sizeof encoded, "%%%02x", static_cast<unsigned>(byte));
        owned_buffer buffer = new_buffer();

        int64_t length = string_append_urlencode(buffer.get(), text.c_str());

        std::string expected = passes_by_the_rule(byte) ? text : encoded;
        EXPECT_EQ(text_of(buffer), expected);
        EXPECT_EQ(length, static_cast<int64_t>(expected.size()));
    }
}

struct encoding_case {
    const char *text;
    const char *encoded;
};

class Encoding : public testing::TestWithParam<encoding_case> {};

TEST_P(Encoding, LetsLettersDigitsAndFiveMarksThroughAlone)
{
    owned_buffer buffer = buffer_of("q=");

    int64_t length = string_append_urlencode(buffer.get(), GetParam().text);

    EXPECT_EQ(text_of(buffer), std::string("q=") + GetParam().encoded);
    EXPECT_EQ(length, static_cast<int64_t>(string_get_size(buffer.get())));
    EXPECT_TRUE(ranges_of(buffer).empty());
}

INSTANTIATE_TEST_SUITE_P(
    Texts, Encoding,
    testing::Values(encoding_case{"a-b_c.d~e", "a%2db%5fc%2ed%7ee"},
                    encoding_case{"(x)*!^", "(x)*!^"}, encoding_case{"\xc3\xa9", "%c3%a9"},
                    encoding_case{"someone@example.com", "someone%40example%2ecom"},
                    encoding_case{"two words", "two%20words"}, encoding_case{"100%", "100%25"},
                    encoding_case{"a+b&c=d", "a%2bb%26c%3dd"},
                    encoding_case{"\x01\x7f\x80\xff", "%01%7f%80%ff"},
                    encoding_case{"\"#$%&'", "%22%23%24%25%26%27"}, encoding_case{"", ""}));

TEST(EncodedAppend, GivesANewBufferStorageForAnEmptyText)
{
    owned_buffer buffer = new_buffer(0);

    EXPECT_EQ(string_append_urlencode(buffer.get(), ""), 0);

    EXPECT_STREQ(string_get(buffer.get()), "");
    EXPECT_EQ(buffer->capacity, 1u);
}

TEST(EncodedAppend, GrowsTheBufferByWhatItAppends)
{
    owned_buffer buffer = new_buffer(0);

    string_append_urlencode(buffer.get(), "a-b");

    EXPECT_EQ(buffer->capacity, 6u);
}

// Both the storage and the text behind it are what appending the encoded text would have made,
// however much room there was.
TEST(EncodedAppend, GrowsAsForAnyOtherText)
{
    const std::pair<std::string, std::string> texts[] = {{"", ""},
                                                         {"a", "a"},
                                                         {"/", "%2f"},
                                                         {"abc", "abc"},
                                                         {"//", "%2f%2f"},
                                                         {"a/b", "a%2fb"},
                                                         {"///", "%2f%2f%2f"},
                                                         {"abcdef", "abcdef"},
                                                         {"/abc", "%2fabc"},
                                                         {"abc//", "abc%2f%2f"}};
    for (const auto &[text, encoded] : texts) {
        for (uint64_t capacity = 0; capacity < 40; ++capacity) {
            SCOPED_TRACE(text + " in " + std::to_string(capacity));
            owned_buffer buffer = new_buffer(capacity);
            owned_buffer expected = new_buffer(capacity);
            string_append(buffer.get(), "begun");
            string_append(expected.get(), "begun");

            string_append_urlencode(buffer.get(), text.c_str());
            string_append(expected.get(), encoded.c_str());

            EXPECT_STREQ(string_get(buffer.get()), string_get(expected.get()));
            EXPECT_EQ(buffer->length, expected->length);
            EXPECT_EQ(buffer->capacity, expected->capacity);
        }
    }
}

TEST(EncodedAppend, TakesALongText)
{
    owned_buffer buffer = new_buffer();
    std::string text;
    std::string encoded;
    for (int count = 0; count < 100000; ++count) {
        text += "a/";
        encoded += "a%2f";
    }

    EXPECT_EQ(string_append_urlencode(buffer.get(), text.c_str()), 400000);
    EXPECT_EQ(text_of(buffer), encoded);
}

} // namespace
} // namespace quillmere_test
