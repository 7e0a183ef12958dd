// Failures of jobs that take several steps.
#include "failure.h"

#include <cerrno>

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

TEST(FileFailure, SaysWhatHelpsAgainstIt)
{
    EXPECT_EQ(line_of(file_failure("cannot read a", ENOENT)),
              "quillmere: cannot read a: No such file or directory (check the path)\n");
    EXPECT_EQ(file_failure("cannot write a", ENOSPC).advice, "make room, then run it again");
    EXPECT_EQ(file_failure("cannot write a", EACCES).advice, "check who may read and write there");
    EXPECT_EQ(file_failure("cannot write a", ENOSPC, "buy a disk").advice, "buy a disk");
    EXPECT_EQ(file_failure("cannot read a", EIO).advice, "");
}

} // namespace
} // namespace quillmere_test
