// The rendering of numbers.
#include <gtest/gtest.h>

#include <cstring>
#include <ostream>
#include <string>

#include "quillmere.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

struct number_case {
    uint64_t number;
    int32_t base;
    std::string digits;
};

std::ostream &operator<<(std::ostream &out, const number_case &number)
{
    return out << number.number << " in base " << number.base;
}

class NumberInBase : public testing::TestWithParam<number_case> {};

TEST_P(NumberInBase, IsAppended)
{
    owned_buffer buffer = buffer_of("n=");

    int64_t length = string_append_num_base(buffer.get(), GetParam().number, GetParam().base);

    EXPECT_EQ(text_of(buffer), "n=" + GetParam().digits);
    EXPECT_EQ(length, static_cast<int64_t>(2 + GetParam().digits.size()));
    EXPECT_TRUE(ranges_of(buffer).empty());
}

TEST_P(NumberInBase, IsRenderedAtTheEndOfTheCallersScratch)
{
    char scratch[65];
    std::memset(scratch, '#', sizeof scratch);

    char *first = itoa_s(GetParam().number, GetParam().base, scratch);

    EXPECT_EQ(first, GetParam().digits);
    EXPECT_EQ(first - scratch, static_cast<ptrdiff_t>(64 - GetParam().digits.size()));
    EXPECT_EQ(scratch[64], '\0');
    for (const char *untouched = scratch; untouched < first; ++untouched)
        ASSERT_EQ(*untouched, '#') << "at index " << untouched - scratch;
}

constexpr uint64_t highest_bit = uint64_t{1} << 63;

INSTANTIATE_TEST_SUITE_P(
    Numbers, NumberInBase,
    testing::Values(number_case{0, 10, "0"}, number_case{0, 2, "0"}, number_case{0, 16, "0"},
                    number_case{1, 10, "1"}, number_case{9, 10, "9"}, number_case{10, 10, "10"},
                    number_case{4096, 10, "4096"},
                    number_case{UINT64_MAX, 10, "18446744073709551615"}, number_case{255, 16, "ff"},
                    number_case{256, 16, "100"},
                    number_case{0x0123456789abcdef, 16, "123456789abcdef"},
                    number_case{UINT64_MAX, 16, "ffffffffffffffff"}, number_case{8, 8, "10"},
                    number_case{14, 15, "e"}, number_case{26, 3, "222"}, number_case{5, 2, "101"},
                    number_case{highest_bit - 1, 2, std::string(63, '1')},
                    number_case{highest_bit / 2, 2, "1" + std::string(62, '0')}));

// Of 64 binary digits the first one is lost.
INSTANTIATE_TEST_SUITE_P(SixtyFourDigits, NumberInBase,
                         testing::Values(number_case{highest_bit, 2, std::string(63, '0')},
                                         number_case{UINT64_MAX, 2, std::string(63, '1')},
                                         number_case{highest_bit + 5, 2,
                                                     std::string(60, '0') + "101"}));

struct decimal_case {
    uint64_t number;
    const char *digits;
};

class DecimalNumber : public testing::TestWithParam<decimal_case> {};

TEST_P(DecimalNumber, IsAppended)
{
    owned_buffer buffer = buffer_of("n=");

    int64_t length = string_append_num(buffer.get(), GetParam().number);

    EXPECT_EQ(text_of(buffer), std::string("n=") + GetParam().digits);
    EXPECT_EQ(length, static_cast<int64_t>(string_get_size(buffer.get())));
}

INSTANTIATE_TEST_SUITE_P(Numbers, DecimalNumber,
                         testing::Values(decimal_case{0, "0"}, decimal_case{4096, "4096"},
                                         decimal_case{static_cast<uint64_t>(-1),
                                                      "18446744073709551615"}));

TEST(Number, IsNotAppendedToNull)
{
    EXPECT_EQ(string_append_num(nullptr, 1), -1);
    EXPECT_EQ(string_append_num_base(nullptr, 1, 16), -1);
}

} // namespace
} // namespace quillmere_test
