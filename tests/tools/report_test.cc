#include "transfers/report.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "failure.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::HasSubstr;

transferred file(outcome how, std::uint64_t size) { return {how, "from", "to", "key", size}; }

void fail(exit_code code) { throw failure(code, "it broke"); }

failure told_by(const transfer_report &report)
{
    try {
        report.require_success();
    } catch (const failure &problem) {
        return problem;
    }
    return failure(exit_code::done, "");
}

} // namespace

TEST(TransferReport, ThrowsTheFailureOfTheOnlyFile)
{
    transfer_report report(batch::one, "uploaded");

    EXPECT_THROW(report.attempt([] { fail(exit_code::refused); }), failure);
}

TEST(TransferReport, GoesOnAfterAFailureOfOneFileOfMany)
{
    transfer_report report(batch::many, "uploaded");

    report.attempt([] { fail(exit_code::refused); });
    report.attempt([&] { report.add(file(outcome::created, 2048)); });
    report.attempt([] { fail(exit_code::local_file); });

    const failure told = told_by(report);
    EXPECT_EQ(told.code, exit_code::partly_done);
    EXPECT_EQ(told.why, "uploaded 1 file (2.0 KiB), but 2 files failed");
}

TEST(TransferReport, IsAFailureWhenNothingWasDone)
{
    transfer_report report(batch::many, "uploaded");

    report.attempt([] { fail(exit_code::refused); });

    const failure told = told_by(report);
    EXPECT_EQ(told.code, exit_code::refused);
    EXPECT_THAT(told.why, HasSubstr("it broke"));
}

TEST(TransferReport, EndsWhenNothingMoreCanSucceed)
{
    for (const exit_code code : {exit_code::network, exit_code::not_signed_in, exit_code::other}) {
        transfer_report report(batch::many, "uploaded");
        report.add(file(outcome::created, 1));
        report.add(file(outcome::unchanged, 5));
        try {
            report.attempt([code] { fail(code); });
            ADD_FAILURE() << "it went on";
        } catch (const failure &problem) {
            EXPECT_EQ(problem.code, exit_code::partly_done);
            EXPECT_EQ(problem.why, "uploaded 1 file (1 B), 1 file was up to date, but it broke");
        }
    }
}

} // namespace quillmere_test
