// The string buffer: how it grows, what it records as secret, who owns what.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <ostream>
#include <string>
#include <vector>

#include "quillmere.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

constexpr uint64_t inert_end = UINT64_MAX; // -1 as it is stored

TEST(StringBuffer, IsEmptyWithoutStorageIfNoCapacityIsAskedFor)
{
    owned_buffer buffer = new_buffer(0);

    EXPECT_EQ(string_get(buffer.get()), nullptr);
    EXPECT_EQ(string_get_size(buffer.get()), 0u);
    EXPECT_EQ(buffer->length, 0u);
    EXPECT_EQ(buffer->capacity, 0u);
    EXPECT_EQ(buffer->bytes, nullptr);
    EXPECT_EQ(buffer->redaction_ranges, nullptr);
    EXPECT_EQ(buffer->redacted_copy, nullptr);
}

class InitialCapacity : public testing::TestWithParam<uint64_t> {};

TEST_P(InitialCapacity, IsAllocatedExactlyForAnEmptyText)
{
    owned_buffer buffer = new_buffer(GetParam());

    EXPECT_EQ(buffer->capacity, GetParam());
    EXPECT_STREQ(string_get(buffer.get()), "");
    EXPECT_EQ(string_get_size(buffer.get()), 0u);
    EXPECT_EQ(buffer->redaction_ranges, nullptr);
    EXPECT_EQ(buffer->redacted_copy, nullptr);
}

INSTANTIATE_TEST_SUITE_P(Values, InitialCapacity, testing::Values(1, 2, 64, 256, 100000));

TEST(StringBuffer, AllocatesExactlyWhatTheFirstAppendNeeds)
{
    owned_buffer buffer = new_buffer(0);

    int64_t length = string_append_len(buffer.get(), "hello", 5);

    EXPECT_EQ(length, 5);
    EXPECT_EQ(buffer->capacity, 6u);
    EXPECT_STREQ(string_get(buffer.get()), "hello");
}

TEST(StringBuffer, GetsOneByteForAnAppendOfNothing)
{
    owned_buffer buffer = new_buffer(0);

    int64_t length = string_append_len(buffer.get(), "", 0);

    EXPECT_EQ(length, 0);
    EXPECT_EQ(buffer->capacity, 1u);
    EXPECT_STREQ(string_get(buffer.get()), "");
}

TEST(StringBuffer, AppendsAnEmptyText)
{
    owned_buffer buffer = new_buffer(0);

    EXPECT_EQ(string_append(buffer.get(), ""), 0);
    EXPECT_EQ(buffer->capacity, 1u);
    EXPECT_STREQ(string_get(buffer.get()), "");
}

struct growth_case {
    const char *what;
    uint64_t initial;
    uint64_t first; // bytes in the buffer before
    uint64_t second;
    uint64_t capacity; // after the second append
};

std::ostream &operator<<(std::ostream &out, const growth_case &growth)
{
    return out << growth.what;
}

class Growth : public testing::TestWithParam<growth_case> {};

TEST_P(Growth, IsToTheNeedOrTheDouble)
{
    const growth_case &growth = GetParam();
    std::string text(growth.first + growth.second, 'x');
    owned_buffer buffer = new_buffer(growth.initial);
    string_append_len(buffer.get(), text.data(), growth.first);

    int64_t length = string_append_len(buffer.get(), text.data(), growth.second);

    EXPECT_EQ(length, static_cast<int64_t>(text.size()));
    EXPECT_EQ(buffer->length, text.size());
    EXPECT_EQ(buffer->capacity, growth.capacity);
    EXPECT_EQ(text_of(buffer), text);
    EXPECT_EQ(buffer->bytes[text.size()], '\0');
}

INSTANTIATE_TEST_SUITE_P(
    Cases, Growth,
    testing::Values(growth_case{"fits exactly", 16, 10, 5, 16},
                    growth_case{"one byte too many", 16, 10, 6, 32},
                    growth_case{"as much as the double", 16, 10, 21, 32},
                    growth_case{"one more than the double", 16, 10, 22, 33},
                    growth_case{"far more than the double", 16, 10, 1000, 1011},
                    growth_case{"after an exact first allocation", 0, 5, 1, 12},
                    growth_case{"nothing to a full buffer", 16, 15, 0, 16},
                    growth_case{"from a capacity of one", 1, 0, 1, 2},
                    growth_case{"from a capacity of one by much", 1, 0, 7, 8}));

TEST(StringBuffer, DoublesItsCapacityByteForByte)
{
    owned_buffer buffer = new_buffer(1);
    std::vector<uint64_t> capacities;

    for (int count = 0; count < 1000; ++count) {
        string_append_len(buffer.get(), "x", 1);
        if (capacities.empty() || capacities.back() != buffer->capacity)
            capacities.push_back(buffer->capacity);
    }

    EXPECT_EQ(capacities, (std::vector<uint64_t>{2, 4, 8, 16, 32, 64, 128, 256, 512, 1024}));
}

TEST(StringBuffer, JoinsWhatIsAppended)
{
    owned_buffer buffer = new_buffer();

    EXPECT_EQ(string_append(buffer.get(), "one"), 3);
    EXPECT_EQ(string_append(buffer.get(), ", "), 5);
    EXPECT_EQ(string_append_len(buffer.get(), "two and more", 3), 8);

    EXPECT_STREQ(string_get(buffer.get()), "one, two");
    EXPECT_EQ(string_get_size(buffer.get()), 8u);
    EXPECT_TRUE(ranges_of(buffer).empty());
}

TEST(StringBuffer, TakesBytesOfAnyKind)
{
    owned_buffer buffer = new_buffer();
    std::string bytes("a\0b\xff\n\0", 6);

    int64_t length = string_append_len(buffer.get(), bytes.data(), bytes.size());

    EXPECT_EQ(length, 6);
    EXPECT_EQ(text_of(buffer), bytes);
    EXPECT_EQ(buffer->bytes[6], '\0');
}

TEST(StringBuffer, StopsAtTheNulOfAText)
{
    owned_buffer buffer = new_buffer();

    EXPECT_EQ(string_append(buffer.get(), "ab\0cd"), 2);
    EXPECT_EQ(text_of(buffer), "ab");
}

TEST(StringBuffer, GivesItsOwnStorage)
{
    owned_buffer buffer = buffer_of("text");

    EXPECT_EQ(string_get(buffer.get()), buffer->bytes);
}

using append_function = int64_t (*)(string_buffer *, const char *);

class CheckedAppend : public testing::TestWithParam<append_function> {};

TEST_P(CheckedAppend, RefusesANullText)
{
    owned_buffer buffer = buffer_of("text");

    EXPECT_EQ(GetParam()(buffer.get(), nullptr), -1);

    EXPECT_EQ(text_of(buffer), "text");
    EXPECT_TRUE(ranges_of(buffer).empty());
}

TEST_P(CheckedAppend, RefusesANullBuffer)
{
    EXPECT_EQ(GetParam()(nullptr, "text"), -1);
    EXPECT_EQ(GetParam()(nullptr, nullptr), -1);
}

INSTANTIATE_TEST_SUITE_P(Functions, CheckedAppend,
                         testing::Values(string_append, string_append_urlencode,
                                         string_append_obfs));

TEST(SecretAppend, RecordsTheRangeOfItsText)
{
    owned_buffer buffer = buffer_of("password=");

    int64_t length = string_append_obfs(buffer.get(), "XYZ");

    EXPECT_EQ(length, 12);
    EXPECT_EQ(text_of(buffer), "password=XYZ");
    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{9, 12}}));
}

TEST(SecretAppend, RecordsTheRangeOfItsBytes)
{
    owned_buffer buffer = buffer_of("a");
    std::string bytes("\0X\0", 3);

    int64_t length = string_append_len_obfs(buffer.get(), bytes.data(), bytes.size());

    EXPECT_EQ(length, 4);
    EXPECT_EQ(text_of(buffer), "a" + bytes);
    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{1, 4}}));
}

TEST(SecretAppend, RecordsTheRangeOfTheEncodedText)
{
    owned_buffer buffer = buffer_of("p=");

    int64_t length = string_append_urlencode_obfs(buffer.get(), "a b");

    EXPECT_EQ(length, 7);
    EXPECT_EQ(text_of(buffer), "p=a%20b");
    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{2, 7}}));
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "p=(omitted)");
}

TEST(SecretAppend, RecordsAnEmptyRangeForAnEmptyText)
{
    owned_buffer buffer = buffer_of("a");

    EXPECT_EQ(string_append_obfs(buffer.get(), ""), 1);
    EXPECT_EQ(string_append_len_obfs(buffer.get(), "x", 0), 1);
    EXPECT_EQ(string_append_urlencode_obfs(buffer.get(), ""), 1);

    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{1, 1}, {1, 1}, {1, 1}}));
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "a");
}

TEST(SecretAppend, OfAnEncodedNullTextAddsARangeThatHidesNothing)
{
    owned_buffer buffer = buffer_of("abc");

    int64_t result = string_append_urlencode_obfs(buffer.get(), nullptr);

    EXPECT_EQ(result, -1);
    EXPECT_EQ(text_of(buffer), "abc");
    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{3, inert_end}}));
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "abc");
}

TEST(SecretAppend, OfAnEncodedNullTextHidesNothingOfWhatFollowsEither)
{
    owned_buffer buffer = new_buffer();

    string_append_urlencode_obfs(buffer.get(), nullptr);
    string_append(buffer.get(), "visible");

    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{0, inert_end}}));
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "visible");
}

TEST(RedactionRanges, StandInTheOrderInWhichTheyWereAdded)
{
    owned_buffer buffer = buffer_of("0123456789");

    string_add_obfs_range(buffer.get(), 7, 9);
    string_add_obfs_range(buffer.get(), 0, 1);
    string_append_obfs(buffer.get(), "ab");
    string_add_obfs_range(buffer.get(), 3, 2);

    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{7, 9}, {0, 1}, {10, 12}, {3, 2}}));
}

TEST(RedactionRanges, AreStoredUnchecked)
{
    owned_buffer buffer = new_buffer();

    string_add_obfs_range(buffer.get(), UINT64_MAX, 0);
    string_add_obfs_range(buffer.get(), uint64_t{1} << 40, (uint64_t{1} << 40) + 1);

    EXPECT_EQ(ranges_of(buffer),
              (std::vector<range>{{UINT64_MAX, 0}, {uint64_t{1} << 40, (uint64_t{1} << 40) + 1}}));
}

TEST(RedactionRanges, NeverAlterTheText)
{
    owned_buffer buffer = buffer_of("secret");
    string_add_obfs_range(buffer.get(), 0, 6);

    string_get_obfs(buffer.get(), nullptr);

    EXPECT_STREQ(string_get(buffer.get()), "secret");
    EXPECT_EQ(string_get_size(buffer.get()), 6u);
}

struct reduction {
    uint64_t count;
    const char *rest;
};

class Reduction : public testing::TestWithParam<reduction> {};

TEST_P(Reduction, CutsBytesOffTheEnd)
{
    owned_buffer buffer = buffer_of("abcdef");
    uint64_t capacity = buffer->capacity;

    int64_t length = string_reduce(buffer.get(), GetParam().count);

    EXPECT_EQ(length, static_cast<int64_t>(std::strlen(GetParam().rest)));
    EXPECT_STREQ(string_get(buffer.get()), GetParam().rest);
    EXPECT_EQ(string_get_size(buffer.get()), std::strlen(GetParam().rest));
    EXPECT_EQ(buffer->capacity, capacity);
}

INSTANTIATE_TEST_SUITE_P(Counts, Reduction,
                         testing::Values(reduction{0, "abcdef"}, reduction{1, "abcde"},
                                         reduction{5, "a"}, reduction{6, ""}, reduction{7, ""},
                                         reduction{UINT64_MAX, ""}));

TEST(StringBuffer, KeepsRangesAndTheRedactedCopyWhenItIsReduced)
{
    owned_buffer buffer = buffer_of("abcdef");
    string_add_obfs_range(buffer.get(), 2, 6);
    const char *copy = string_get_obfs(buffer.get(), nullptr);

    string_reduce(buffer.get(), 3);

    EXPECT_EQ(buffer->redacted_copy, copy);
    EXPECT_STREQ(copy, "ab(omitted)");
    EXPECT_EQ(ranges_of(buffer), (std::vector<range>{{2, 6}}));
    EXPECT_STREQ(string_get_obfs(buffer.get(), nullptr), "ab(omitted)");
}

TEST(StringBuffer, CanBeReducedWithoutStorage)
{
    owned_buffer buffer = new_buffer(0);

    EXPECT_EQ(string_reduce(buffer.get(), 3), 0);
    EXPECT_EQ(string_get(buffer.get()), nullptr);
}

TEST(StringBuffer, GrowsAgainAfterBeingReduced)
{
    owned_buffer buffer = buffer_of("/one/two");

    string_reduce(buffer.get(), 4);
    string_append(buffer.get(), "/three");

    EXPECT_STREQ(string_get(buffer.get()), "/one/three");
}

class KeepingFlag : public testing::TestWithParam<int32_t> {};

TEST_P(KeepingFlag, LeavesTheTextToTheCaller)
{
    string_buffer *buffer = string_new(0);
    string_append_obfs(buffer, "the text lives on");
    string_get_obfs(buffer, nullptr);
    char *text = buffer->bytes;

    string_delete(buffer, GetParam());

    EXPECT_STREQ(text, "the text lives on");
    std::free(text);
}

INSTANTIATE_TEST_SUITE_P(Values, KeepingFlag, testing::Values(0, 2, -1, 256, INT32_MIN));

TEST(StringBuffer, CanBeDeletedWithoutEverHavingHadStorage)
{
    string_delete(string_new(0), 1);
    string_delete(string_new(0), 0);
}

TEST(StringBuffer, DeletesNothingForNull) { string_delete(nullptr, 1); }

TEST(StringDup, CopiesAText)
{
    std::string text = "some text";

    char *copy = string_dup(text.c_str());

    EXPECT_STREQ(copy, "some text");
    EXPECT_NE(copy, text.c_str());
    std::free(copy);
}

TEST(StringDup, CopiesAnEmptyText)
{
    char *copy = string_dup("");

    EXPECT_STREQ(copy, "");
    std::free(copy);
}

TEST(StringDup, GivesNullForNull) { EXPECT_EQ(string_dup(nullptr), nullptr); }

} // namespace
} // namespace quillmere_test
