// Refused, reset, cut off, stalled: what a bad network does to an exchange, and how often it is
// tried again.
#include <chrono>

#include "support/library_fixture.h"
#include "support/resources.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

class FailedTransfer : public library_test {
protected:
    std::string url() const { return plain_server.base_url() + path; }
};

void expect_nothing(const exchange &result)
{
    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(result.length, 0u);
}

TEST_F(FailedTransfer, MakesOneAttemptAtARefusedConnectionWhenOneIsAllowed)
{
    refused_port refused;

    exchange result = fetch(refused.base_url() + path);

    expect_nothing(result);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_COULDNT_CONNECT)));
}

TEST_F(FailedTransfer, MakesAsManyAttemptsAsAreAllowed)
{
    set_connection_attempts(4);
    refused_port refused;

    expect_nothing(fetch(refused.base_url() + path));

    EXPECT_THAT(log.text(), MatchesRegex(repeated(failure_line(CURLE_COULDNT_CONNECT), 4)));
}

TEST_F(FailedTransfer, ReachesTheServerOnceAnAttempt)
{
    set_connection_attempts(5);
    plain_server.script(closing());

    expect_nothing(fetch(url()));

    EXPECT_EQ(plain_server.connections(), 5u);
    EXPECT_EQ(plain_server.requests().size(), 5u);
    EXPECT_THAT(log.text(), MatchesRegex(repeated(failure_line(CURLE_GOT_NOTHING), 5)));
}

TEST_F(FailedTransfer, MakesSixAttemptsUnlessToldOtherwise)
{
    ca_cert_pem_path.connection_attempts = 6; // as it is initially
    plain_server.script(closing());

    expect_nothing(fetch(url()));

    EXPECT_EQ(plain_server.connections(), 6u);
}

TEST_F(FailedTransfer, MakesNoAttemptWhereNoneIsAllowed)
{
    ca_cert_pem_path.connection_attempts = 0;

    expect_nothing(fetch(url()));

    EXPECT_EQ(plain_server.connections(), 0u);
    EXPECT_EQ(log.text(), "");
}

TEST_F(FailedTransfer, EndsWithTheFirstAttemptThatSucceeds)
{
    set_connection_attempts(5);
    plain_server.next({closing(), resetting(), answering(http_reply(200, "at last"))});

    exchange result = fetch(url());

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "at last");
    EXPECT_EQ(plain_server.connections(), 3u);
    EXPECT_THAT(log.text(), MatchesRegex(repeated(any_failure_line, 2)));
}

TEST_F(FailedTransfer, LeavesNothingOfItsBodyToTheNextAttempt)
{
    set_connection_attempts(2);
    plain_server.next({answering("HTTP/1.1 200 OK\r\nContent-Length: 100\r\n\r\nthe first half"),
                       answering(http_reply(200, "whole"))});

    exchange result = fetch(url());

    EXPECT_EQ(result.body, "whole");
    EXPECT_EQ(result.length, 5u);
}

TEST_F(FailedTransfer, SendsABodyAgainWithEveryAttempt)
{
    set_connection_attempts(3);
    plain_server.next({closing(), closing(), answering(http_reply(200, "taken"))});

    EXPECT_EQ(fetch(url(), post_of("the body")).body, "taken");

    ASSERT_EQ(plain_server.requests().size(), 3u);
    for (const request &each : plain_server.requests()) {
        EXPECT_EQ(each.method, "POST");
        EXPECT_EQ(each.body, "the body");
    }
}

TEST_F(FailedTransfer, IsABodyThatIsShorterThanAnnounced)
{
    plain_server.answer("HTTP/1.1 200 OK\r\nContent-Length: 100\r\n\r\nnot a hundred bytes");

    expect_nothing(fetch(url()));

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_PARTIAL_FILE)));
}

TEST_F(FailedTransfer, IsAChunkedBodyWithoutItsEnd)
{
    plain_server.answer(
        "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n64\r\nnot a hundred bytes");

    expect_nothing(fetch(url()));

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_PARTIAL_FILE)));
}

TEST_F(FailedTransfer, IsAnAnswerThatIsNotHttp)
{
    plain_server.script([](connection &client) {
        client.read_request();
        client.send("220 mail.example ready for something else altogether\r\n");
        client.close();
    });

    expect_nothing(fetch(url()));

    EXPECT_THAT(log.text(), MatchesRegex(any_failure_line));
}

TEST_F(FailedTransfer, IsAPlainAnswerWhereTlsWasAsked)
{
    plain_server.script([](connection &client) {
        client.read_some();
        client.send(http_reply(400, "speak plainly"));
        client.close();
    });

    expect_nothing(fetch("https://127.0.0.1:" + std::to_string(plain_server.port()) + path));

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CONNECT_ERROR)));
}

TEST_F(FailedTransfer, LeavesNoDescriptorOpen)
{
    set_connection_attempts(10);
    plain_server.script(resetting());
    fetch(url()); // what libcurl opens once and keeps
    plain_server.wait_until_idle();
    size_t before = open_descriptors();

    fetch(url());

    plain_server.wait_until_idle();
    EXPECT_EQ(open_descriptors(), before);
}

class elapsed_time {
public:
    double seconds() const
    {
        return std::chrono::duration<double>(std::chrono::steady_clock::now() - start_).count();
    }

private:
    std::chrono::steady_clock::time_point start_ = std::chrono::steady_clock::now();
};

// Far from the other time-out in force, for a machine under load.
constexpr double well_before_ten_seconds = 8;

TEST_F(FailedTransfer, EndsAStalledOneAtTheTimeOutOfTheCall)
{
    plain_server.script(stalling());
    elapsed_time elapsed;

    expect_nothing(fetch(url(), {nullptr, 0}, 1));

    EXPECT_GE(elapsed.seconds(), 0.9);
    EXPECT_LT(elapsed.seconds(), well_before_ten_seconds);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_OPERATION_TIMEDOUT)));
}

class TimeOutBelowOne : public FailedTransfer, public testing::WithParamInterface<int64_t> {};

TEST_P(TimeOutBelowOne, MeansTheDefault)
{
    set_default_timeout(1);
    plain_server.script(stalling());
    elapsed_time elapsed;

    expect_nothing(fetch(url(), {nullptr, 0}, GetParam()));

    EXPECT_GE(elapsed.seconds(), 0.9);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_OPERATION_TIMEDOUT)));
}

INSTANTIATE_TEST_SUITE_P(Seconds, TimeOutBelowOne, testing::Values(0, -1, INT64_MIN));

TEST_F(FailedTransfer, CountsItsTimeAfreshForEveryAttempt)
{
    // More than two, for a machine on which an answer takes a second.
    set_connection_attempts(10);
    plain_server.next({stalling(), answering(http_reply(200, "at last"))});

    EXPECT_EQ(fetch(url(), {nullptr, 0}, 1).body, "at last");
}

TEST_F(FailedTransfer, EndsASlowOneThoughItNeverStands)
{
    plain_server.script([](connection &client) {
        client.read_request();
        client.send("HTTP/1.1 200 OK\r\n\r\n");
        client.send_until_closed("drop ", std::chrono::milliseconds(20));
    });

    expect_nothing(fetch(url(), {nullptr, 0}, 1));

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_OPERATION_TIMEDOUT)));
}

TEST_F(FailedTransfer, EndsAStalledTlsHandshakeToo)
{
    plain_server.script([](connection &client) {
        client.read_some();
        client.stall();
    });

    expect_nothing(
        fetch("https://127.0.0.1:" + std::to_string(plain_server.port()) + path, {nullptr, 0}, 1));

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_OPERATION_TIMEDOUT)));
}

// The phases of an exchange in which a connection may be reset.
struct phase {
    const char *name;
    const char *sent_before; // null: not even the request is read
};

void PrintTo(const phase &each, std::ostream *out) { *out << each.name; }

class ConnectionReset : public FailedTransfer,
                        public testing::WithParamInterface<std::tuple<phase, bool>> {
protected:
    static connection_script reset_in(const phase &each)
    {
        return [each](connection &client) {
            if (each.sent_before) {
                client.read_request();
                client.send(each.sent_before);
            }
            client.reset();
        };
    }
};

TEST_P(ConnectionReset, IsAFailureAndTriedAgain)
{
    const auto &[when, with_tls] = GetParam();
    scripted_server &peer = with_tls ? server : plain_server;
    set_connection_attempts(3);
    peer.next({reset_in(when), reset_in(when), answering(http_reply(200, "at last"))});

    exchange result = fetch(peer.base_url() + path);

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "at last");
    EXPECT_EQ(peer.connections(), 3u);
    EXPECT_THAT(log.text(), MatchesRegex(repeated(any_failure_line, 2)));
}

TEST_P(ConnectionReset, EndsInNothingWhenItNeverStops)
{
    const auto &[when, with_tls] = GetParam();
    scripted_server &peer = with_tls ? server : plain_server;
    set_connection_attempts(2);
    peer.script(reset_in(when));

    expect_nothing(fetch(peer.base_url() + path));

    EXPECT_EQ(peer.connections(), 2u);
    EXPECT_THAT(log.text(), MatchesRegex(repeated(any_failure_line, 2)));
}

INSTANTIATE_TEST_SUITE_P(
    Phases, ConnectionReset,
    testing::Combine(
        testing::Values(phase{"before the request", nullptr}, phase{"after the request", ""},
                        phase{"in the status line", "HTTP/1.1 20"},
                        phase{"in the headers", "HTTP/1.1 200 OK\r\nContent-Le"},
                        phase{"before the body", "HTTP/1.1 200 OK\r\nContent-Length: 9\r\n\r\n"},
                        phase{"in the body", "HTTP/1.1 200 OK\r\nContent-Length: 9\r\n\r\nnot "}),
        testing::Bool()));

} // namespace
} // namespace quillmere_test
