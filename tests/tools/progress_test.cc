#include "transfers/progress.h"

#include <gtest/gtest.h>

#include "text.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using std::chrono::milliseconds;

constexpr std::uint64_t mebibyte = 1 << 20;

} // namespace

TEST(Progress, WritesSizesAsPeopleRead)
{
    const struct {
        std::uint64_t bytes;
        const char *text;
    } rows[] = {{0, "0 B"},
                {1023, "1023 B"},
                {1024, "1.0 KiB"},
                {1536, "1.5 KiB"},
                {mebibyte - 1, "1.0 MiB"},
                {mebibyte, "1.0 MiB"},
                {5 * mebibyte / 2, "2.5 MiB"},
                {mebibyte << 10, "1.0 GiB"},
                {mebibyte << 30, "1024.0 TiB"}};
    for (const auto &row : rows)
        EXPECT_EQ(size_text(row.bytes), row.text) << row.bytes;
}

TEST(Progress, ShowsPartRateAndTimeLeft)
{
    const progress_state half = {"a.jpg", 20 * mebibyte, 10 * mebibyte, 0, milliseconds(2000)};

    EXPECT_EQ(bar_text(half, 70),
              "a.jpg   50%  [==============              ]  10.0 MiB  5.0 MiB/s  0:02");
}

TEST(Progress, CountsTheRateOfThisRunAlone)
{
    const progress_state resumed = {"a", 100 * mebibyte, 100 * mebibyte, 90 * mebibyte,
                                    milliseconds(1000)};

    EXPECT_NE(bar_text(resumed, 100).find("10.0 MiB/s"), std::string::npos);
}

TEST(Progress, KnowsNoTimeLeftWhileNothingMoves)
{
    const progress_state stalled = {"a", mebibyte, 0, 0, milliseconds(5000)};

    EXPECT_NE(bar_text(stalled, 100).find("-:--"), std::string::npos);
}

TEST(Progress, WritesLongTimesWithHours)
{
    const progress_state slow = {"a", 10'000, 1'000, 0, milliseconds(1'000'000)};

    EXPECT_NE(bar_text(slow, 100).find("2:30:00"), std::string::npos);
}

TEST(Progress, IsWholeForAnEmptyFile)
{
    EXPECT_NE(bar_text({"a", 0, 0, 0, milliseconds(0)}, 100).find("100%"), std::string::npos);
}

TEST(Progress, NeverTakesMoreColumnsThanThereAre)
{
    const progress_state state = {"\xc3\xa4" + std::string(300, 'x') + "\x1b[2J", 3 * mebibyte,
                                  mebibyte, 0, milliseconds(1000)};
    for (std::size_t room = 3; room < 120; ++room) {
        const std::string text = bar_text(state, room);
        EXPECT_LE(columns(text), room);
        EXPECT_EQ(text.find('\x1b'), std::string::npos) << "the name of a file must do nothing";
    }
}

TEST(Progress, TellsTheWholeAtTheEnd)
{
    EXPECT_EQ(summary_text({"a.jpg", mebibyte, mebibyte, 0, milliseconds(61'000)}),
              "a.jpg  1.0 MiB  in 1:01  16.8 KiB/s");
}

} // namespace quillmere_test
