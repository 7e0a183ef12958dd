// Allocations of libcurl, expat and OpenSSL fail, one after the other: an ordinary failed attempt
// or a malformed reply, nothing of the library's lost, and everything as before afterwards.
#include <gtest/gtest.h>

#include <regex>

#include "exhaustion/file_service.h"
#include "exhaustion/library_memory.h"
#include "exhaustion/subject.h"
#include "interpose/clock.h"
#include "interpose/heap.h"
#include "runtime/kept_certificates.h"
#include "support/quick_server.h"

namespace quillmere_test {
namespace {

const bool openssl_is_hooked = hook_openssl();

struct library_run {
    call_outcome outcome;
    size_t refused;
    int64_t kept;            // blocks of ours
    int64_t kept_by_library; // and of the other library's
};

library_run starve(memory_of library, const subject &starved, shortage lack)
{
    library_run run = {};
    const int64_t ours = blocks_held();
    const int64_t theirs = blocks_held_by(library);
    {
        const starved_call call = starved.prepare();
        const starved_library memory(library, lack.allowed, lack.refusals);
        run.outcome = call();
        run.refused = memory.refused();
    }
    run.kept = blocks_held() - ours;
    run.kept_by_library = blocks_held_by(library) - theirs;
    return run;
}

call_outcome fed_outcome(memory_of library, const subject &fed)
{
    return starve(library, fed, {SIZE_MAX, 0}).outcome;
}

// Calls check(run) for every step-th shortage until one is not felt any more. Says how many were.
template <class Check>
size_t starve_step_by_step(memory_of library, const subject &starved, const Check &check,
                           size_t step = 1)
{
    size_t felt = 0;
    for (size_t refusals : refusals_of_shortages)
        for (size_t allowed = 0;; allowed += step) {
            SCOPED_TRACE(starved.name + ", " + std::to_string(allowed) + " allowed, " +
                         std::to_string(refusals) + " refused");
            const library_run run = starve(library, starved, {allowed, refusals});
            check(run);
            felt += run.refused > 0 ? 1 : 0;
            if (run.refused == 0 || testing::Test::HasFailure())
                break;
        }
    return felt;
}

class StarvedLibcurl : public testing::TestWithParam<subject> {
protected:
    hooked_libcurl hooks;
    file_service service;
};

TEST_P(StarvedLibcurl, IsAnOrdinaryFailedAttempt)
{
    service.answer_nothing();
    const call_outcome failed = fed_outcome(memory_of::libcurl, GetParam());
    service.answer(success_body(GetParam().payload));
    const call_outcome fed = fed_outcome(memory_of::libcurl, GetParam());

    size_t felt = starve_step_by_step(memory_of::libcurl, GetParam(), [&](const library_run &run) {
        EXPECT_TRUE(run.outcome == fed || run.outcome == failed) << run.outcome;
        EXPECT_EQ(run.kept, 0);
        EXPECT_EQ(run.kept_by_library, 0);
    });

    EXPECT_GT(felt, 0u);
    EXPECT_EQ(fed_outcome(memory_of::libcurl, GetParam()), fed);
}

TEST_P(StarvedLibcurl, IsMadeGoodForByTheNextAttempt)
{
    set_connection_attempts(2);
    service.answer(success_body(GetParam().payload));
    const call_outcome fed = fed_outcome(memory_of::libcurl, GetParam());

    for (size_t allowed = 0;; ++allowed) {
        const library_run run = starve(memory_of::libcurl, GetParam(), {allowed, 1});
        ASSERT_EQ(run.outcome, fed) << allowed;
        if (run.refused == 0)
            break;
    }
}

INSTANTIATE_TEST_SUITE_P(All, StarvedLibcurl, testing::ValuesIn(operation_subjects()),
                         subject_name);

// The results of an operation without what a reply that is damaged may leave in them: numbers, a
// list that has been deleted, and in the place of a token the token or a message.
std::string without_remains(std::string results)
{
    results = std::regex_replace(results, std::regex("=[0-9]+"), "=0");
    results = std::regex_replace(results, std::regex("changes=deleted"), "changes=NULL");
    results = std::regex_replace(results, std::regex("token=.*?( pkey=|$)"), "token=NULL$1");
    return std::regex_replace(results, std::regex("pkey=.*"), "pkey=NULL");
}

class StarvedExpat : public testing::TestWithParam<subject> {
protected:
    // Reads the reply with too little memory for expat, at every point. Says how many there are.
    size_t starve_with(const std::string &reply)
    {
        service.answer_nothing();
        const call_outcome failed = fed_outcome(memory_of::expat, GetParam());
        service.answer(reply);
        const call_outcome fed = fed_outcome(memory_of::expat, GetParam());
        return starve_step_by_step(memory_of::expat, GetParam(), [&](const library_run &run) {
            EXPECT_TRUE(run.outcome == fed || is_damaged(run.outcome, fed.status, failed))
                << run.outcome;
            EXPECT_TRUE(run.kept == 0 || loses_its_pkey(run)) << run.kept;
            EXPECT_EQ(run.kept_by_library, 0);
        });
    }

    // Deliberately: the slot is freed and what it held is not.
    static bool loses_its_pkey(const library_run &run)
    {
        return run.kept == 1 && run.outcome.results.find("pkey=freed") != std::string::npos;
    }

    // A refusal whose number was read keeps it, with or without its message.
    static bool is_damaged(const call_outcome &outcome, int32_t fed_status,
                           const call_outcome &failed)
    {
        if (outcome.status == QM_OK)
            return false;
        return (outcome.status == QM_MALFORMED_REPLY || outcome.status == fed_status) &&
               without_remains(outcome.results) == without_remains(failed.results);
    }

    file_service service;
};

TEST_P(StarvedExpat, IsAMalformedReplyToASuccess)
{
    EXPECT_GT(starve_with(success_body(GetParam().payload)), 0u);
}

TEST_P(StarvedExpat, IsAMalformedReplyToARefusal)
{
    EXPECT_GT(starve_with("<response><result>Error</result><error>105</error>"
                          "<message>No</message></response>"),
              0u);
}

INSTANTIATE_TEST_SUITE_P(All, StarvedExpat, testing::ValuesIn(operation_subjects()), subject_name);

class StarvedReader : public testing::TestWithParam<subject> {
protected:
    file_service quiet;
};

TEST_P(StarvedReader, NeverTakesAPartForTheWhole)
{
    const call_outcome fed = fed_outcome(memory_of::expat, GetParam());

    starve_step_by_step(memory_of::expat, GetParam(), [&](const library_run &run) {
        if (run.outcome.status == 0) {
            EXPECT_EQ(run.outcome, fed);
        }
        EXPECT_EQ(run.kept, 0);
        EXPECT_EQ(run.kept_by_library, 0);
    });

    EXPECT_EQ(fed_outcome(memory_of::expat, GetParam()), fed);
}

INSTANTIATE_TEST_SUITE_P(All, StarvedReader, testing::ValuesIn(reading_subjects()), subject_name);

int64_t port_in(const std::string &base_url)
{
    return std::stoi(base_url.substr(base_url.rfind(':') + 1));
}

// What a transfer comes to that fails.
bool is_failure(const call_outcome &outcome)
{
    return outcome.status <= 0 &&
           (outcome.results.empty() || outcome.results == "response=NULL length=0" ||
            outcome.results == "no connection");
}

// The transfers on a server, plain and TLS, with all that a connection takes.
class StarvedTransfers : public testing::Test {
protected:
    // OpenSSL that ran out of memory may leave libcurl waiting for what never comes.
    StarvedTransfers() { set_default_timeout(5); }

    static std::string reply(const request &) { return http_reply(200, "answer"); }

    void starve(memory_of library, const subject &starved, size_t step = 1)
    {
        const call_outcome fed = fed_outcome(library, starved);
        EXPECT_FALSE(is_failure(fed)) << starved << ": " << fed;

        size_t felt = starve_step_by_step(
            library, starved,
            [&](const library_run &run) {
                EXPECT_TRUE(run.outcome == fed || is_failure(run.outcome)) << run.outcome;
                EXPECT_EQ(run.kept, 0);
            },
            step);

        EXPECT_GT(felt, 0u);
        EXPECT_EQ(fed_outcome(library, starved), fed);
    }

    proxyless_environment environment;
    quick_server_process plain_server{reply};
    quick_server_process tls_server{reply, tls_with(loopback_certificate())};
    hooked_libcurl hooks;
    file_service quiet{test_root_path().c_str()};
};

// Thousands of allocations of OpenSSL go into each connection. All of them are tried with
// QUILLMERE_EVERY_ALLOCATION set, which takes minutes.
const size_t shortage_step =
    std::getenv("QUILLMERE_EVERY_ALLOCATION") ? 1 : 7 * QUILLMERE_EXHAUSTION_STEP;

TEST_F(StarvedTransfers, OfLibcurlAreFailedAttempts)
{
    for (const subject &each : transfer_subjects(plain_server.base_url()))
        starve(memory_of::libcurl, each);
}

TEST_F(StarvedTransfers, OfLibcurlAreFailedAttemptsOverTls)
{
    for (const subject &each : transfer_subjects(tls_server.base_url()))
        starve(memory_of::libcurl, each);
}

TEST_F(StarvedTransfers, OfLibcurlNeverGoPastTheProxy)
{
    const quick_server_process proxy([](const request &) { return http_reply(200, "by proxy"); });
    set_user_proxy("127.0.0.1", port_in(proxy.base_url()), "user", "password");
    proxy_server.enabled = 1;

    starve(memory_of::libcurl, transfer_subjects(plain_server.base_url()).front());
}

TEST_F(StarvedTransfers, OfOpensslAreFailedAttempts)
{
    ASSERT_TRUE(openssl_is_hooked);

    starve(memory_of::openssl, transfer_subjects(tls_server.base_url()).front(), shortage_step);
}

// What is kept for later requests must not remember a shortage of an earlier one.
TEST_F(StarvedTransfers, OfOpensslLeaveTheKeptCertificatesWhole)
{
    const pretended_time an_hour_later(std::time(nullptr) + 3600); // so that they are kept at once
    const subject fetching = transfer_subjects(tls_server.base_url()).front();
    const call_outcome fed = fed_outcome(memory_of::openssl, fetching);

    for (bool kept_before : {false, true})
        for (size_t allowed = 0;; allowed += shortage_step) {
            SCOPED_TRACE(std::to_string(allowed) + (kept_before ? ", kept" : ", not yet kept"));
            if (!kept_before)
                quillmere::forget_certificates();
            const library_run run =
                quillmere_test::starve(memory_of::openssl, fetching, {allowed, 1});
            ASSERT_EQ(fed_outcome(memory_of::openssl, fetching), fed);
            if (run.refused == 0)
                break;
        }
}

} // namespace
} // namespace quillmere_test
