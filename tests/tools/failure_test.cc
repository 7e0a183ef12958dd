// Failures of jobs that take several steps.
#include "failure.h"

#include <gtest/gtest.h>

namespace quillmere_test {
namespace {

using namespace quillmere::tools;

failure failure_after(const std::string &done)
{
    try {
        after(done, [] {
            failure problem(exit_code::refused, "the name is taken", "take another");
            problem.status = 115;
            throw problem;
        });
    } catch (const failure &problem) {
        return problem;
    }
    return failure(exit_code::done, "nothing failed");
}

TEST(LaterStep, ThatFailsLeavesTheJobPartlyDone)
{
    const failure problem = failure_after("moved a");

    EXPECT_EQ(problem.code, exit_code::partly_done);
    EXPECT_EQ(problem.why, "moved a, but the name is taken");
    EXPECT_EQ(problem.advice, "take another");
    EXPECT_EQ(problem.status, 115);
}

TEST(LaterStep, ThatIsTheFirstFailsAsItIs)
{
    const failure problem = failure_after("");

    EXPECT_EQ(problem.code, exit_code::refused);
    EXPECT_EQ(problem.why, "the name is taken");
}

} // namespace
} // namespace quillmere_test
