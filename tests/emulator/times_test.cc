#include "times.h"

#include <gtest/gtest.h>

using namespace emulator;

TEST(Times, AreWrittenInUniversalTime)
{
    EXPECT_EQ(time_text(0), "1970-01-01 00:00:00");
    EXPECT_EQ(time_text(1'700'000'000), "2023-11-14 22:13:20");
    EXPECT_EQ(date_text(1'700'000'000), "2023-11-14");
}

TEST(Times, AreWrittenForAHeaderWithTheNameOfTheDay)
{
    EXPECT_EQ(http_date(0), "Thu, 01 Jan 1970 00:00:00 GMT");
    EXPECT_EQ(http_date(1'700'000'000), "Tue, 14 Nov 2023 22:13:20 GMT");
}

TEST(Times, AreReadInEitherForm)
{
    for (const char *text :
         {"1700000000", "2023-11-14 22:13:20", "2023-11-14T22:13:20", "2023-11-14T22:13:20Z"})
        EXPECT_EQ(parse_time(text), 1'700'000'000) << text;
    EXPECT_EQ(parse_time("0"), 0);
    EXPECT_EQ(parse_time("1969-12-31 23:59:59"), -1);
    EXPECT_EQ(parse_time("2024-02-29 00:00:00"), 1'709'164'800);
}

TEST(Times, ThatNoCalendarHasAreNone)
{
    for (const char *text :
         {"", "Z", "yesterday", "-1", "2023-02-29 00:00:00", "2023-13-01 00:00:00",
          "2023-01-01 24:00:00", "2023-01-01 00:60:00", "2023-01-01", "2023/01/01 00:00:00",
          "2023-01-01x00:00:00", "2023-01-01 00:00:0x", "253402300800"})
        EXPECT_FALSE(parse_time(text)) << text;
}
