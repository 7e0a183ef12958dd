// Every row of the table as a GET, as a POST and through an operation, with one attempt and with
// three.
#include <array>
#include <memory>
#include <thread>

#include "faults/ways.h"
#include "interpose/libcurl_heap.h"
#include "runtime/tls_locks.h"
#include "support/hook_recorder.h"
#include "support/library_fixture.h"
#include "support/resources.h"
#include "support/thread_log.h"

namespace quillmere_test {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using testing::MatchesRegex;
using testing::StartsWith;

constexpr milliseconds allowance{500};
constexpr size_t number_of_ways = std::size(ways);

bool speaks_tls(wire each) { return each == wire::https || each == wire::http_to_tls_server; }

const char *scheme_of(wire each)
{
    return each == wire::http || each == wire::http_to_tls_server ? "http" : "https";
}

std::shared_ptr<scripted_server> new_server(wire on, const certificate &shown)
{
    return std::make_shared<scripted_server>(speaks_tls(on) ? tls_with(shown) : server_options());
}

// What the process holds once nothing goes on any more.
struct holdings {
    size_t descriptors;
    size_t threads;
    int64_t libcurl_blocks;
};

class Fault : public testing::TestWithParam<trial> {
protected:
    Fault();

    const fault &row() const { return GetParam().what; }

    // A server for each way, so that all go on at the same time and wait together. There is but one
    // proxy at a time, which all share.
    struct stage {
        std::shared_ptr<scripted_server> server;
        std::shared_ptr<scripted_server> elsewhere; // where the server redirects to, if it does
        std::string base;
        size_t connections_before = 0;
        size_t requests_before = 0;
        size_t elsewhere_before = 0;
    };

    void configure_trust() const;
    void set(stage &each) const;
    void redirect(stage &each) const;
    std::string base_for(const scripted_server &server) const;
    bool by_proxy() const;
    void go_by_proxy() const;
    std::array<outcome_of_call, number_of_ways> play(int32_t attempts);
    void check(size_t number, const outcome_of_call &outcome, int32_t attempts);
    void check_log(const way &by, const outcome_of_call &outcome, int32_t failures, bool succeeded);
    void check_time(const outcome_of_call &outcome, int32_t attempts) const;
    holdings holdings_at_rest();
    void check_that_it_ends_as_its_row_says();

    proxyless_environment environment;
    globals_guard globals;
    counted_libcurl_heap libcurl_heap;
    thread_log log;
    hook_recorder hook;
    running_library library{test_root_path().c_str()};
    refused_port nobody;
    std::optional<full_port> full; // which takes a moment to make
    std::array<stage, number_of_ways> stages;
};

Fault::Fault()
{
    set_default_timeout(row().timeout_seconds);
    configure_trust();
    if (row().to == destination::full_queue)
        full.emplace();
    for (stage &each : stages)
        set(each);
    if (by_proxy())
        go_by_proxy();
    urls[1] = stages.back().base.c_str(); // the operation's
}

void Fault::configure_trust() const
{
    if (row().trusts == trust::anything)
        ssl_disabled = 1;
    else if (row().trusts == trust::missing_file)
        replace_owned_text(ca_cert_pem_path.path, test_root_path() + ".missing");
    else if (row().trusts == trust::nothing)
        replace_owned_text(ca_cert_pem_path.path, std::nullopt);
}

void Fault::set(stage &each) const
{
    each.server = by_proxy() && stages.front().server ? stages.front().server
                                                      : new_server(GetParam().on, row().shown());
    if (row().redirects_to)
        redirect(each);
    else
        each.server->next(row().scripts);
    each.base = base_for(*each.server);
}

void Fault::redirect(stage &each) const
{
    each.elsewhere = new_server(*row().redirects_to, loopback_certificate());
    each.elsewhere->answer(xml_reply(good_body));
    each.server->answer(
        http_reply(302, "moved", {"Location: " + each.elsewhere->base_url() + "/elsewhere"}));
}

std::string Fault::base_for(const scripted_server &server) const
{
    std::string scheme = scheme_of(GetParam().on);
    switch (row().to) {
    case destination::server:
        return scheme + "://127.0.0.1:" + std::to_string(server.port());
    case destination::nobody:
        return nobody.base_url(scheme);
    case destination::full_queue:
        return full->base_url(scheme);
    case destination::unknown_host:
        // A label of 64 letters is too long to be asked of any name server.
        return scheme + "://" + std::string(64, 'a') + ".example";
    case destination::server_as_proxy:
    case destination::nobody_as_proxy:
        return scheme + "://service.example";
    }
    return "";
}

bool Fault::by_proxy() const
{
    return row().to == destination::server_as_proxy || row().to == destination::nobody_as_proxy;
}

void Fault::go_by_proxy() const
{
    bool served = row().to == destination::server_as_proxy;
    uint16_t port = served ? stages.front().server->port() : nobody.port();
    set_user_proxy("127.0.0.1", port, nullptr, nullptr);
    proxy_server.enabled = 1;
}

std::array<outcome_of_call, number_of_ways> Fault::play(int32_t attempts)
{
    set_connection_attempts(attempts);
    std::array<outcome_of_call, number_of_ways> outcomes;
    std::array<std::thread, number_of_ways> players;
    for (size_t i = 0; i < number_of_ways; ++i)
        players[i] = std::thread([&, i] { outcomes[i] = ways[i].call(stages[i].base); });
    for (std::thread &each : players)
        each.join();
    return outcomes;
}

void Fault::check(size_t number, const outcome_of_call &outcome, int32_t attempts)
{
    const expectation &expected = row().expected;
    bool succeeded = expected.succeeds_at > 0 && expected.succeeds_at <= attempts;
    int32_t made = succeeded ? expected.succeeds_at : attempts;
    int32_t failures = succeeded ? made - 1 : made;
    stage &own = stages[number];
    size_t times = static_cast<size_t>(made);
    size_t sharers = by_proxy() ? number_of_ways : 1;

    ways[number].check(outcome, expected, succeeded);
    check_log(ways[number], outcome, failures, succeeded);
    check_time(outcome, attempts);
    EXPECT_EQ(outcome.blocks_kept, 0);
    EXPECT_EQ(own.server->connections(),
              own.connections_before += sharers * times * expected.connections);
    EXPECT_EQ(own.server->requests().size(),
              own.requests_before += sharers * times * expected.requests);
    if (own.elsewhere) {
        EXPECT_EQ(own.elsewhere->requests().size(),
                  own.elsewhere_before += times * expected.elsewhere);
    }
}

void Fault::check_log(const way &by, const outcome_of_call &outcome, int32_t failures,
                      bool succeeded)
{
    std::string line;
    for (CURLcode each : row().expected.failures)
        line += (line.empty() ? "" : "|") + failure_line(each, "[^\n]*"); // not all say something
    std::string before = by.log_before(stages[static_cast<size_t>(&by - ways)].base);
    std::string after = by.log_after(row().expected, succeeded);

    EXPECT_THAT(outcome.log,
                MatchesRegex(literally(before) +
                             repeated("(" + line + ")", static_cast<size_t>(failures)) +
                             literally(after)));
}

void Fault::check_time(const outcome_of_call &outcome, int32_t attempts) const
{
    seconds time_outs(attempts * row().timeout_seconds);
    EXPECT_LT(outcome.time, time_outs + allowance);
    if (row().waits) {
        EXPECT_GE(outcome.time, time_outs - allowance / 10 * attempts);
    }
}

holdings Fault::holdings_at_rest()
{
    for (stage &each : stages) {
        EXPECT_TRUE(each.server->wait_until_idle());
        EXPECT_TRUE(!each.elsewhere || each.elsewhere->wait_until_idle());
    }
    return {open_descriptors(), threads(), libcurl_heap.blocks_held()};
}

void Fault::check_that_it_ends_as_its_row_says()
{
    // What libcurl opens once and keeps is open after the first exchange.
    std::optional<holdings> before;
    for (int32_t attempts : {1, 3}) {
        auto outcomes = play(attempts);

        holdings now = holdings_at_rest();
        for (size_t i = 0; i < number_of_ways; ++i) {
            SCOPED_TRACE(ways[i].name + (" with attempts: " + std::to_string(attempts)));
            check(i, outcomes[i], attempts);
        }
        if (before) {
            EXPECT_EQ(now.descriptors, before->descriptors);
            EXPECT_EQ(now.threads, before->threads);
            EXPECT_EQ(now.libcurl_blocks, before->libcurl_blocks);
        }
        before = now;
        for (stage &each : stages) // a row's scripts begin anew with every call
            if (!row().redirects_to)
                each.server->next(row().scripts);
    }
    EXPECT_EQ(hook.calls().size(), 0u);
}

TEST_P(Fault, EndsAsItsRowSays) { check_that_it_ends_as_its_row_says(); }

// Where libcurl's TLS library is another, it reads the certificates itself.
class FaultWithCertificatesFromTheFile : public Fault {
protected:
    FaultWithCertificatesFromTheFile() { quillmere::shares_openssl_with_libcurl = false; }
};

TEST_P(FaultWithCertificatesFromTheFile, EndsAsItsRowSays) { check_that_it_ends_as_its_row_says(); }

std::string name_of(const testing::TestParamInfo<trial> &info) { return info.param.name(); }

using testing::ValuesIn;

INSTANTIATE_TEST_SUITE_P(Connection, Fault, ValuesIn(trials_of(connection_faults())), name_of);
INSTANTIATE_TEST_SUITE_P(CutOff, Fault, ValuesIn(trials_of(cut_off_replies())), name_of);
INSTANTIATE_TEST_SUITE_P(Malformed, Fault, ValuesIn(trials_of(malformed_replies())), name_of);
INSTANTIATE_TEST_SUITE_P(Unexpected, Fault, ValuesIn(trials_of(unexpected_replies())), name_of);
INSTANTIATE_TEST_SUITE_P(Redirected, Fault, ValuesIn(trials_of(redirect_faults())), name_of);
INSTANTIATE_TEST_SUITE_P(Certificate, Fault, ValuesIn(trials_of(certificate_faults())), name_of);
INSTANTIATE_TEST_SUITE_P(Certificate, FaultWithCertificatesFromTheFile,
                         ValuesIn(trials_of(certificate_faults())), name_of);
INSTANTIATE_TEST_SUITE_P(Proxied, Fault, ValuesIn(trials_of(proxy_faults())), name_of);

} // namespace
} // namespace quillmere_test
