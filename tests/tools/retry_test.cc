// How often a read is repeated, and how long the pauses are, with a clock and a chance of our own.
#include "retry.h"

#include <vector>

#include <gtest/gtest.h>

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using std::chrono::milliseconds;

class Retry : public testing::Test {
protected:
    Retry()
    {
        world.chance = [this] { return chance; };
        world.sleep = [this](pause_length pause) { slept.push_back(pause); };
        world.announce = [this](const exchange &, pause_length pause) {
            announced.push_back(pause);
        };
    }

    // Gives the statuses in turn, the last one for ever.
    exchange repeated(std::vector<std::int32_t> statuses, int repetitions)
    {
        const auto attempt = [&, count = std::size_t{0}]() mutable {
            exchange ended;
            ended.status = statuses[std::min(count++, statuses.size() - 1)];
            ++attempts;
            return ended;
        };
        return with_repetitions(attempt, repetitions, world);
    }

    double chance = 0;
    int attempts = 0;
    std::vector<milliseconds> slept;
    std::vector<milliseconds> announced;
    retry_world world;
};

TEST_F(Retry, PausesDoubleFromHalfASecondToHalfAMinute)
{
    const std::vector<int> longest = {500, 1000, 2000, 4000, 8000, 16000, 30000, 30000};
    for (std::size_t i = 0; i < longest.size(); ++i) {
        const auto index = static_cast<int>(i);
        EXPECT_EQ(pause_before(index, 0.0), milliseconds(longest[i] / 2)) << i;
        EXPECT_EQ(pause_before(index, 0.5), milliseconds(longest[i] * 3 / 4)) << i;
        EXPECT_LT(pause_before(index, 0.999999), milliseconds(longest[i])) << i;
    }
    EXPECT_EQ(pause_before(1000, 0.0), milliseconds(15000));
}

TEST_F(Retry, EndsWithTheFirstSuccess)
{
    const exchange ended = repeated({-2, -2, 0}, 4);

    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(attempts, 3);
    EXPECT_EQ(slept, (std::vector<milliseconds>{milliseconds(250), milliseconds(500)}));
    EXPECT_EQ(announced, slept);
}

TEST_F(Retry, GivesUpAfterTheRepetitionsAllowed)
{
    const exchange ended = repeated({-2}, 4);

    EXPECT_EQ(ended.status, -2);
    EXPECT_EQ(attempts, 5);
    EXPECT_EQ(slept.size(), 4U);
}

TEST_F(Retry, MakesOneAttemptWhereNoRepetitionIsAllowed)
{
    repeated({-2}, 0);

    EXPECT_EQ(attempts, 1);
    EXPECT_TRUE(slept.empty());
}

TEST_F(Retry, DoesNotRepeatWhatWouldFailAgain)
{
    for (const std::int32_t status : {0, 105, -8, -9}) {
        attempts = 0;
        repeated({status}, 4);
        EXPECT_EQ(attempts, 1) << status;
    }
}

TEST_F(Retry, LeavesThePausesToChance)
{
    chance = 0.5;

    repeated({-2, 0}, 4);

    EXPECT_EQ(slept, std::vector<milliseconds>{milliseconds(375)});
}

TEST_F(Retry, TakesItsChanceFromTheWholeRange)
{
    const retry_world real = real_world();
    double lowest = 1;
    double highest = 0;
    for (int i = 0; i < 1000; ++i) {
        const double drawn = real.chance();
        lowest = std::min(lowest, drawn);
        highest = std::max(highest, drawn);
    }

    EXPECT_GE(lowest, 0.0);
    EXPECT_LT(lowest, 0.1);
    EXPECT_GT(highest, 0.9);
    EXPECT_LT(highest, 1.0);
}

} // namespace
} // namespace quillmere_test
