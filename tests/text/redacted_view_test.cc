// The view of a string buffer that may be logged.
#include <gtest/gtest.h>

#include <ostream>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "quillmere.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

constexpr uint64_t negative(int64_t number) { return static_cast<uint64_t>(number); }

owned_buffer buffer_with(const std::string &text, const std::vector<range> &ranges)
{
    owned_buffer buffer = buffer_of(text);
    for (const auto &[start, end] : ranges)
        string_add_obfs_range(buffer.get(), start, end);
    return buffer;
}

struct view_case {
    const char *what;
    std::vector<range> ranges;
    const char *view; // of "0123456789"
};

std::ostream &operator<<(std::ostream &out, const view_case &view) { return out << view.what; }

class RedactedView : public testing::TestWithParam<view_case> {};

TEST_P(RedactedView, HasOneMarkerForEachUnbrokenStretch)
{
    owned_buffer buffer = buffer_with("0123456789", GetParam().ranges);

    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), GetParam().view);
    EXPECT_EQ(text_of(buffer), "0123456789");
}

constexpr uint64_t four_gigabytes = uint64_t{1} << 32;

INSTANTIATE_TEST_SUITE_P(
    Ranges, RedactedView,
    testing::Values(
        view_case{"in the middle", {{4, 6}}, "0123(omitted)6789"},
        view_case{"at the start", {{0, 3}}, "(omitted)3456789"},
        view_case{"at the end", {{7, 10}}, "0123456(omitted)"},
        view_case{"everything", {{0, 10}}, "(omitted)"},
        view_case{"a single byte", {{5, 6}}, "01234(omitted)6789"},
        view_case{"reversed", {{10, 4}}, "0123(omitted)"},
        view_case{"reversed within the text", {{6, 4}}, "0123(omitted)6789"},
        view_case{"touching", {{2, 5}, {5, 8}}, "01(omitted)89"},
        view_case{"touching, added backwards", {{5, 8}, {2, 5}}, "01(omitted)89"},
        view_case{"one byte apart", {{2, 5}, {6, 8}}, "01(omitted)5(omitted)89"},
        view_case{"one byte apart, added backwards", {{6, 8}, {2, 5}}, "01(omitted)5(omitted)89"},
        view_case{"overlapping", {{2, 6}, {4, 8}}, "01(omitted)89"},
        view_case{"one within another", {{2, 8}, {4, 5}}, "01(omitted)89"},
        view_case{"the same twice", {{2, 5}, {2, 5}}, "01(omitted)56789"},
        view_case{"two at the ends", {{0, 1}, {9, 10}}, "(omitted)12345678(omitted)"},
        view_case{"empty", {{4, 4}}, "0123456789"},
        view_case{"empty within another", {{2, 5}, {3, 3}}, "01(omitted)56789"},
        view_case{"past the end", {{8, 100}}, "01234567(omitted)"},
        view_case{"ending one past the end", {{8, 11}}, "01234567(omitted)"},
        view_case{"starting at the end", {{10, 12}}, "0123456789"},
        view_case{"starting behind the end", {{50, 60}}, "0123456789"},
        view_case{"reversed past the end", {{100, 8}}, "01234567(omitted)"},
        view_case{"ending at -1", {{3, negative(-1)}}, "0123456789"},
        view_case{"starting at -1", {{negative(-1), 3}}, "0123456789"},
        view_case{"negative", {{negative(-5), negative(-2)}}, "0123456789"},
        view_case{"inert beside another",
                  {{3, negative(-1)}, {4, 6}, {negative(-9), 9}},
                  "0123(omitted)6789"},
        view_case{"the greatest signed end", {{4, 0x7fffffff}}, "0123(omitted)"},
        view_case{"an end that turns negative", {{4, 0x80000000}}, "0123456789"},
        view_case{"a start that turns negative", {{0x80000000, 4}}, "0123456789"},
        view_case{"high halves that do not count",
                  {{four_gigabytes + 4, 3 * four_gigabytes + 6}},
                  "0123(omitted)6789"},
        view_case{"a start whose low half is the end's", {{four_gigabytes + 4, 4}}, "0123456789"}));

TEST(RedactedViewMarker, IsWhatTheCallerNames)
{
    owned_buffer buffer = buffer_with("a=1&password=XYZ&b=2", {{13, 16}});

    EXPECT_STREQ(string_get_obfs(buffer.get(), "***"), "a=1&password=***&b=2");
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "a=1&password=(omitted)&b=2");
}

TEST(RedactedViewMarker, MayBeEmpty)
{
    owned_buffer buffer = buffer_with("0123456789", {{2, 5}, {7, 8}});

    EXPECT_STREQ(string_get_obfs(buffer.get(), ""), "015689");
}

TEST(RedactedViewMarker, MayBeLongerThanTheText)
{
    owned_buffer buffer = buffer_with("0123", {{1, 2}, {3, 4}});
    std::string marker(1000, '#');

    EXPECT_EQ(string_get_obfs(buffer.get(), marker.c_str()), "0" + marker + "2" + marker);
}

TEST(RedactedViewCopy, IsTheTextItselfWithoutRanges)
{
    owned_buffer buffer = buffer_of("text");

    EXPECT_EQ(string_get_obfs(buffer.get(), "***"), string_get(buffer.get()));
    EXPECT_EQ(buffer->redacted_copy, nullptr);
}

TEST(RedactedViewCopy, IsNullWithoutRangesAndStorage)
{
    owned_buffer buffer = new_buffer(0);

    EXPECT_EQ(string_get_obfs(buffer.get(), nullptr), nullptr);
}

TEST(RedactedViewCopy, IsAnEmptyTextForAnEmptyBufferWithRanges)
{
    owned_buffer buffer = new_buffer(0);
    string_add_obfs_range(buffer.get(), 0, 5);

    const char *view = string_get_obfs(buffer.get(), nullptr);

    EXPECT_STREQ(view, "");
    EXPECT_EQ(view, buffer->redacted_copy);
    EXPECT_EQ(string_get(buffer.get()), nullptr);
}

TEST(RedactedViewCopy, IsACopyEvenIfTheRangesHideNothing)
{
    owned_buffer buffer = buffer_with("text", {{2, 2}});

    const char *view = string_get_obfs(buffer.get(), nullptr);

    EXPECT_STREQ(view, "text");
    EXPECT_NE(view, string_get(buffer.get()));
    EXPECT_EQ(view, buffer->redacted_copy);
}

TEST(RedactedViewCopy, IsReplacedByTheNextView)
{
    owned_buffer buffer = buffer_with("secret", {{0, 6}});
    string_get_obfs(buffer.get(), "first");

    const char *second = string_get_obfs(buffer.get(), "second");

    EXPECT_STREQ(second, "second");
    EXPECT_EQ(buffer->redacted_copy, second);
}

TEST(RedactedViewCopy, IsLeftInPlaceByAViewWithoutRanges)
{
    owned_buffer buffer = buffer_with("secret", {{0, 6}});
    const char *copy = string_get_obfs(buffer.get(), nullptr);
    redaction_range *ranges = std::exchange(buffer->redaction_ranges, nullptr);

    const char *view = string_get_obfs(buffer.get(), nullptr);

    EXPECT_EQ(view, string_get(buffer.get()));
    EXPECT_EQ(buffer->redacted_copy, copy);
    EXPECT_STREQ(copy, "(omitted)");
    buffer->redaction_ranges = ranges;
}

TEST(RedactedViewCopy, StandsApartFromWhatIsAppendedLater)
{
    owned_buffer buffer = buffer_with("secret", {{0, 6}});
    const char *view = string_get_obfs(buffer.get(), nullptr);

    string_append(buffer.get(), "&more");

    EXPECT_STREQ(view, "(omitted)");
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "(omitted)&more");
}

TEST(RedactedViewCopy, HidesWhatARangePastTheEndTurnsOutToCover)
{
    owned_buffer buffer = buffer_with("ab", {{1, 5}});
    string_get_obfs(buffer.get(), nullptr);

    string_append(buffer.get(), "cdefg");

    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "a(omitted)fg");
}

TEST(RedactedViewCopy, KeepsANulThatIsNotHidden)
{
    owned_buffer buffer = buffer_with(std::string("a\0bSECRETc", 10), {{3, 9}});

    const char *view = string_get_obfs(buffer.get(), "*");

    EXPECT_EQ(std::string(view, 6), std::string("a\0b*c\0", 6));
}

// The rule as it is stated, byte for byte and range for range.
std::string view_by_the_rule(const std::string &text, const std::vector<range> &ranges,
                             const std::string &marker)
{
    std::vector<bool> marked(text.size(), false);
    for (const auto &[stored_start, stored_end] : ranges) {
        int64_t start = static_cast<int32_t>(static_cast<uint32_t>(stored_start));
        int64_t end = static_cast<int32_t>(static_cast<uint32_t>(stored_end));
        if (start > end)
            std::swap(start, end);
        if (start < 0)
            continue;
        for (int64_t index = start; index < end && index < int64_t(text.size()); ++index)
            marked[static_cast<size_t>(index)] = true;
    }
    std::string view;
    for (size_t index = 0; index < text.size(); ++index)
        if (!marked[index])
            view += text[index];
        else if (index == 0 || !marked[index - 1])
            view += marker;
    return view;
}

TEST(RedactedViewRule, HoldsForRangesOfEveryKind)
{
    std::mt19937 random(20240229); // the same cases in every run
    std::uniform_int_distribution<int> length(0, 24);
    std::uniform_int_distribution<int> count(1, 6);
    std::uniform_int_distribution<int> index(-3, 28);

    for (int round = 0; round < 20000; ++round) {
        std::string text =
            std::string("abcdefghijklmnopqrstuvwx").substr(0, size_t(length(random)));
        std::vector<range> ranges;
        for (int left = count(random); left > 0; --left)
            ranges.emplace_back(negative(index(random)), negative(index(random)));
        owned_buffer buffer = buffer_with(text, ranges);

        ASSERT_EQ(string_get_obfs(buffer.get(), "<>"), view_by_the_rule(text, ranges, "<>"))
            << "round " << round;
    }
}

} // namespace
} // namespace quillmere_test
