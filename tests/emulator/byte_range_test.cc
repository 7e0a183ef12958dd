#include "byte_range.h"

#include <gtest/gtest.h>

using namespace emulator;

namespace {

struct range_case {
    const char *field;
    std::uint64_t size;
    range_kind kind;
    std::uint64_t first;
    std::uint64_t length;
};

class ByteRange : public testing::TestWithParam<range_case> {};

constexpr auto whole = range_kind::whole;
constexpr auto part = range_kind::part;
constexpr auto none = range_kind::unsatisfiable;

const range_case cases[] = {
    {"", 10, whole, 0, 10},
    {"bytes=0-0", 10, part, 0, 1},
    {"bytes=0-9", 10, part, 0, 10},
    {"bytes=9-9", 10, part, 9, 1},
    {"bytes=3-", 10, part, 3, 7},
    {"bytes=3-99", 10, part, 3, 7},
    {"bytes=3-18446744073709551615", 10, part, 3, 7},
    {"bytes=-3", 10, part, 7, 3},
    {"bytes=-10", 10, part, 0, 10},
    {"bytes=-11", 10, part, 0, 10},
    {"Bytes=1-2", 10, part, 1, 2},
    {"bytes= 1-2 ", 10, part, 1, 2},
    {"bytes=10-", 10, none, 0, 0},
    {"bytes=10-20", 10, none, 0, 0},
    {"bytes=-0", 10, none, 0, 0},
    {"bytes=0-", 0, none, 0, 0},
    {"bytes=-1", 0, none, 0, 0},
    {"bytes=2-1", 10, whole, 0, 10},
    {"bytes=0-1,4-5", 10, whole, 0, 10},
    {"bytes=0-1,", 10, whole, 0, 10},
    {"bytes=", 10, whole, 0, 10},
    {"bytes=-", 10, whole, 0, 10},
    {"bytes=a-b", 10, whole, 0, 10},
    {"bytes=1", 10, whole, 0, 10},
    {"bytes 1-2", 10, whole, 0, 10},
    {"lines=1-2", 10, whole, 0, 10},
    {"bytes=18446744073709551616-", 10, whole, 0, 10},
};

INSTANTIATE_TEST_SUITE_P(Fields, ByteRange, testing::ValuesIn(cases));

} // namespace

TEST_P(ByteRange, MeansThisPart)
{
    const range_case &each = GetParam();

    const byte_range range = range_of(each.field, each.size);

    EXPECT_EQ(range.kind, each.kind) << each.field;
    EXPECT_EQ(range.first, each.first) << each.field;
    EXPECT_EQ(range.length, each.length) << each.field;
}
