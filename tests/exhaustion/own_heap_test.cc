// The library's own allocations fail, one after the other: each call ends as it does with plenty of
// memory, or in the one line and the abort.
#include <gtest/gtest.h>

#include <csignal>
#include <sstream>

#include "exhaustion/child.h"
#include "exhaustion/file_service.h"
#include "exhaustion/subject.h"
#include "interpose/heap.h"
#include "support/quick_server.h"

namespace quillmere_test {
namespace {

// What a run came to: how many allocations were refused, what the call told, and how many blocks of
// the library's are left.
struct starved_run {
    size_t refused = 0;
    int64_t kept = 0;
    std::string told;
};

std::string to_text(const starved_run &run)
{
    return std::to_string(run.refused) + " " + std::to_string(run.kept) + " " + run.told;
}

starved_run from_text(const std::string &text)
{
    starved_run run;
    std::istringstream in(text);
    in >> run.refused >> run.kept >> std::ws;
    std::getline(in, run.told);
    return run;
}

starved_run starve(const subject &starved, shortage lack)
{
    starved_run run;
    const int64_t before = blocks_held();
    {
        const starved_call call = starved.prepare();
        const starved_heap heap(lack.allowed, lack.refusals);
        std::ostringstream told;
        told << call();
        run.told = told.str();
        run.refused = heap.refused();
    }
    run.kept = blocks_held() - before;
    return run;
}

starved_run fed_run(const subject &fed)
{
    return from_text(in_child([&] { return to_text(starve(fed, {SIZE_MAX, 0})); }).told);
}

// How a run ended that was right: unaware of the shortage, in the abort, or in spite of it.
enum class ending { unaware, aborted, recovered };

ending check_run(const subject &starved, shortage lack, const starved_run &fed)
{
    const child_end end = in_child([&] { return to_text(starve(starved, lack)); });
    if (end.signal) {
        EXPECT_EQ(end.signal, SIGABRT);
        EXPECT_EQ(end.err, "quillmere: out of memory\n");
        return ending::aborted;
    }
    const starved_run run = from_text(end.told);
    EXPECT_EQ(run.told, fed.told);
    EXPECT_EQ(run.kept, fed.kept);
    EXPECT_EQ(end.err, "");
    return run.refused > 0 ? ending::recovered : ending::unaware;
}

// Says how many shortages made themselves felt.
size_t starve_step_by_step(const subject &starved, const starved_run &fed)
{
    size_t felt = 0;
    for (size_t allowed = 0; !testing::Test::HasFailure(); allowed += QUILLMERE_EXHAUSTION_STEP) {
        SCOPED_TRACE(starved.name + ", " + std::to_string(allowed) + " allowed");
        const ending momentary = check_run(starved, {allowed, 1}, fed);
        if (momentary == ending::unaware)
            break;
        // A run that was aborted would have gone the same way, had memory not come back.
        if (momentary == ending::recovered)
            check_run(starved, {allowed, SIZE_MAX}, fed);
        ++felt;
    }
    return felt;
}

class StarvedOperation : public testing::TestWithParam<subject> {
protected:
    file_service service;
};

TEST_P(StarvedOperation, HandsOutTheWholeResultOrAborts)
{
    service.answer(success_body(GetParam().payload));
    const starved_run fed = fed_run(GetParam());
    EXPECT_EQ(fed.told.find("status 0,"), 0u) << fed.told;
    EXPECT_EQ(fed.kept, 0);

    EXPECT_GT(starve_step_by_step(GetParam(), fed), 0u);
}

TEST_P(StarvedOperation, TellsTheWholeRefusalOrAborts)
{
    service.answer("<response><result>Error</result><error>105</error><message>No</message>"
                   "</response>");
    const starved_run fed = fed_run(GetParam());
    EXPECT_EQ(fed.told.find("status 105,"), 0u) << fed.told;
    EXPECT_EQ(fed.kept, 0);

    EXPECT_GT(starve_step_by_step(GetParam(), fed), 0u);
}

TEST_P(StarvedOperation, TellsOfADamagedReplyOrAborts)
{
    service.answer("<response><result>Success</result>" + GetParam().payload + "<more>");
    const starved_run fed = fed_run(GetParam());
    EXPECT_EQ(fed.told.find("status -9,"), 0u) << fed.told;

    EXPECT_GT(starve_step_by_step(GetParam(), fed), 0u);
}

TEST_P(StarvedOperation, TellsOfAFailedExchangeOrAborts)
{
    service.answer_nothing();
    const starved_run fed = fed_run(GetParam());
    EXPECT_NE(fed.told.find("status 0,"), 0u) << fed.told;
    EXPECT_EQ(fed.kept, 0);

    EXPECT_GT(starve_step_by_step(GetParam(), fed), 0u);
}

INSTANTIATE_TEST_SUITE_P(All, StarvedOperation, testing::ValuesIn(operation_subjects()),
                         subject_name);

class StarvedReading : public testing::TestWithParam<subject> {
protected:
    file_service quiet;
};

TEST_P(StarvedReading, HandsOutTheWholeResultOrAborts)
{
    const starved_run fed = fed_run(GetParam());
    EXPECT_EQ(fed.kept, 0);

    EXPECT_GT(starve_step_by_step(GetParam(), fed), 0u);
}

INSTANTIATE_TEST_SUITE_P(All, StarvedReading, testing::ValuesIn(reading_subjects()), subject_name);

TEST(StarvedTransfer, HandsOutTheWholeResultOrAborts)
{
    const proxyless_environment environment;
    const quick_server_process server([](const request &) { return http_reply(200, "answer"); });
    const file_service quiet;
    size_t felt = 0; // not by every call: the probe of a status takes no memory of the library's
    for (const subject &each : transfer_subjects(server.base_url())) {
        const starved_run fed = fed_run(each);
        EXPECT_EQ(fed.kept, 0) << each;

        felt += starve_step_by_step(each, fed);
    }
    EXPECT_GT(felt, 0u);
}

} // namespace
} // namespace quillmere_test
