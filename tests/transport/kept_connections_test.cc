// Connections that later requests use again, when that is switched on. The certificate file is for
// kept_certificates_internal_test.cc.
#include <condition_variable>
#include <mutex>
#include <thread>

#include "support/library_fixture.h"
#include "support/resources.h"
#include "support/thread_log.h"
#include "transport/exchange.h"
#include "transport/upload_connection.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

const std::string reply = "HTTP/1.1 200 OK\r\nContent-Length: 4\r\n\r\nkept";

void answer(connection &client)
{
    client.read_request();
    client.send(reply);
}

void answer_all(connection &client)
{
    for (;;)
        answer(client);
}

// The first request is answered, and the second ends the connection.
void answer_one_and_close(connection &client)
{
    answer(client);
    client.read_request();
    client.close();
}

void answer_one_and_reset(connection &client)
{
    answer(client);
    client.read_request();
    client.reset();
}

void answer_one_and_reset_within_the_next(connection &client)
{
    answer(client);
    client.read_some();
    client.reset();
}

void answer_one_and_cut_off_the_next(connection &client)
{
    answer(client);
    client.read_request();
    client.send(reply.substr(0, reply.size() - 1));
    client.close();
}

// Nothing is verified, so that no certificate file has to settle.
class KeptConnections : public library_test, public testing::WithParamInterface<bool> {
protected:
    KeptConnections() : library_test(nullptr)
    {
        set_connection_reuse(1);
        asked().script(answer_all);
    }

    scripted_server &asked() { return GetParam() ? server : plain_server; }
    std::string url() { return asked().base_url() + path; }
    int64_t code(posted body = {nullptr, 0}) { return fetch(url(), body).code; }
};

TEST_P(KeptConnections, ServeOneRequestAfterTheOther)
{
    for (int request = 0; request < 5; ++request)
        EXPECT_EQ(fetch(url()).body, "kept");

    EXPECT_EQ(asked().connections(), 1u);
    EXPECT_EQ(asked().requests().size(), 5u);
    EXPECT_EQ(log.text(), "");
}

TEST_P(KeptConnections, AreClosedWhenTheyAreSwitchedOff)
{
    ASSERT_EQ(code(), 200);

    set_connection_reuse(0);

    EXPECT_TRUE(asked().wait_until_idle());
    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(), 200);
    EXPECT_EQ(asked().connections(), 3u);
    EXPECT_TRUE(asked().wait_until_idle());
}

TEST_P(KeptConnections, AreClosedWhenTheLibraryStops)
{
    set_connection_reuse(0);
    ASSERT_EQ(code(), 200);
    ASSERT_TRUE(asked().wait_until_idle());
    size_t before = open_descriptors();
    set_connection_reuse(1);
    ASSERT_EQ(code(), 200);

    api_global_cleanup();

    EXPECT_TRUE(asked().wait_until_idle());
    EXPECT_EQ(open_descriptors(), before);
    api_global_init(nullptr);
}

TEST_P(KeptConnections, AreKeptAgainAfterTheLibraryWasStoppedAndStarted)
{
    api_global_cleanup();
    api_global_init(nullptr);

    ASSERT_EQ(code(), 200);
    ASSERT_EQ(code(), 200);

    EXPECT_EQ(asked().connections(), 1u);
}

TEST_P(KeptConnections, BringNothingOfARequestIntoTheNext)
{
    ASSERT_EQ(code(post_of("body")), 200);
    ASSERT_EQ(code(), 200);
    ASSERT_EQ(code(post_of("other")), 200);

    std::vector<request> sent = asked().requests();
    EXPECT_EQ(sent.at(0).method, "POST");
    EXPECT_EQ(sent.at(1).method, "GET");
    EXPECT_EQ(sent.at(1).header("Content-Length"), std::nullopt);
    EXPECT_EQ(sent.at(2).body, "other");
    EXPECT_EQ(asked().connections(), 1u);
}

TEST_P(KeptConnections, AreReplacedWhenTheServerHasClosedThem)
{
    asked().script(answer); // and closes

    for (int request = 0; request < 4; ++request)
        EXPECT_EQ(code(), 200);

    EXPECT_EQ(asked().connections(), 4u);
    EXPECT_EQ(log.text(), "");
}

TEST_P(KeptConnections, AreReplacedWhenTheServerClosesThemOnARequest)
{
    asked().next({answer_one_and_close, answer_all});

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(), 200);

    EXPECT_EQ(asked().connections(), 2u);
    EXPECT_EQ(asked().requests().size(), 3u);
    EXPECT_EQ(log.text(), "");
}

TEST_P(KeptConnections, AreReplacedWhenTheServerResetsThemOnAPost)
{
    asked().next({answer_one_and_reset, answer_all});

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(post_of("the body")), 200);

    EXPECT_EQ(asked().connections(), 2u);
    EXPECT_EQ(asked().requests().back().body, "the body");
    EXPECT_EQ(log.text(), "");
}

TEST_P(KeptConnections, AreReplacedWhenTheServerResetsThemWithinAPost)
{
    const std::string body(8 * 1024 * 1024, 'm');
    asked().next({answer_one_and_reset_within_the_next, answer_all});

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(post_of(body)), 200);

    EXPECT_EQ(asked().connections(), 2u);
    EXPECT_TRUE(asked().requests().back().body == body);
    EXPECT_EQ(log.text(), "");
}

TEST_P(KeptConnections, AreReplacedByNewOnesWhoseFailureCounts)
{
    set_connection_attempts(2);
    asked().next({answer_one_and_close, closing()});
    ASSERT_EQ(code(), 200);

    EXPECT_EQ(code(), -1);

    EXPECT_EQ(asked().connections(), 3u);
    EXPECT_THAT(log.text(), MatchesRegex(repeated(any_failure_line, 2)));
}

TEST_P(KeptConnections, AreNotReplacedForAnAnswerThatIsCutOff)
{
    asked().next({answer_one_and_cut_off_the_next, answer_all});
    ASSERT_EQ(code(), 200);

    EXPECT_EQ(code(), -1);

    EXPECT_EQ(asked().connections(), 1u);
    EXPECT_EQ(asked().requests().size(), 2u);
    EXPECT_THAT(log.text(), MatchesRegex(any_failure_line));
    EXPECT_EQ(code(), 200);
    EXPECT_EQ(asked().connections(), 2u);
}

TEST_P(KeptConnections, AreNotUsedForTheAttemptsAfterAFailure)
{
    set_connection_attempts(2);
    asked().next({answer_one_and_cut_off_the_next, answer_all});
    ASSERT_EQ(code(), 200);

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(), 200);

    EXPECT_EQ(asked().connections(), 2u);
    EXPECT_THAT(log.text(), MatchesRegex(any_failure_line));
}

TEST_P(KeptConnections, AreNotUsedByProbes)
{
    ASSERT_EQ(code(), 200);

    EXPECT_EQ(check_url_response_code(url().c_str(), 5000), 1);
    EXPECT_EQ(check_url_response(url().c_str(), "", "kept", 5000), 1);

    EXPECT_EQ(asked().connections(), 3u);
    EXPECT_EQ(code(), 200);
    EXPECT_EQ(asked().connections(), 3u);
}

TEST_P(KeptConnections, AreNotUsedOnceThereIsAProxy)
{
    ASSERT_EQ(code(), 200);
    refused_port nobody;
    set_user_proxy("127.0.0.1", nobody.port(), nullptr, nullptr);
    proxy_server.enabled = 1;

    EXPECT_EQ(code(), -1);

    EXPECT_TRUE(asked().wait_until_idle());
    proxy_server.enabled = 0;
    EXPECT_EQ(code(), 200);
    EXPECT_EQ(asked().connections(), 2u);
}

struct proxy_change {
    const char *what;
    void (*make)();
};

TEST_P(KeptConnections, AreNotUsedOnceTheProxyIsDescribedOtherwise)
{
    const proxy_change changes[] = {
        {"host", [] { replace_owned_text(proxy_server.host, "other.example"); }},
        {"port", [] { ++proxy_server.port; }},
        {"user", [] { replace_owned_text(proxy_server.user, "other"); }},
        {"password", [] { replace_owned_text(proxy_server.password, std::nullopt); }},
        {"ssl_disabled", [] { ssl_disabled = !ssl_disabled; }},
    };
    set_user_proxy("proxy.example", 3128, "user", "password"); // but not used
    ASSERT_EQ(code(), 200);
    for (const proxy_change &each : changes) {
        size_t before = asked().connections();

        each.make();

        EXPECT_EQ(code(), 200);
        EXPECT_EQ(code(), 200);
        EXPECT_EQ(asked().connections(), before + 1) << each.what;
    }
}

TEST_P(KeptConnections, AreNoMoreThanTheThreadsThatUseThem)
{
    constexpr size_t number = 16;
    thread_log quiet;
    std::vector<int64_t> codes(number * 5);
    std::vector<std::thread> threads;
    for (size_t i = 0; i < number; ++i)
        threads.emplace_back([&, i] {
            for (size_t round = 0; round < 5; ++round)
                codes[5 * i + round] = code();
        });
    for (std::thread &each : threads)
        each.join();

    EXPECT_THAT(codes, testing::Each(200));
    EXPECT_LE(asked().connections(), number);
}

// Answers requests in rounds: none of a round before all of them have arrived.
class rounds {
public:
    explicit rounds(size_t size) : size_(size) {}

    void arrive()
    {
        std::unique_lock<std::mutex> lock(mutex_);
        size_t round_ends = (arrived_ / size_ + 1) * size_;
        if (++arrived_ == round_ends)
            complete_.notify_all();
        complete_.wait(lock, [&] { return arrived_ >= round_ends; });
    }

private:
    size_t size_;
    std::mutex mutex_;
    std::condition_variable complete_;
    size_t arrived_ = 0;
};

TEST_P(KeptConnections, AreSixteenAtMost)
{
    constexpr size_t number = 20;
    thread_log quiet;
    rounds all(number);
    asked().script([&](connection &client) {
        for (;;) {
            client.read_request();
            all.arrive();
            client.send(reply);
        }
    });
    for (int round = 0; round < 2; ++round) {
        std::vector<std::thread> threads;
        for (size_t i = 0; i < number; ++i)
            threads.emplace_back([&] { EXPECT_EQ(code(), 200); });
        for (std::thread &each : threads)
            each.join();
    }

    EXPECT_EQ(asked().connections(), number + (number - 16));
    set_connection_reuse(0);
    EXPECT_TRUE(asked().wait_until_idle());
}

INSTANTIATE_TEST_SUITE_P(PlainAndTls, KeptConnections, testing::Bool());

class UploadBesideKeptConnections : public library_test {
protected:
    UploadBesideKeptConnections() : library_test(nullptr) { set_connection_reuse(1); }
};

TEST_F(UploadBesideKeptConnections, HasAConnectionOfItsOwn)
{
    plain_server.script(answer_all);
    std::string url = plain_server.base_url() + path;
    ASSERT_EQ(fetch(url).code, 200);

    opened upload = open_connection(url.c_str(), 0, 5);

    ASSERT_EQ(upload.result, 0);
    EXPECT_TRUE(plain_server.wait_for_connections(2));
    EXPECT_EQ(fetch(url).code, 200);
    EXPECT_EQ(plain_server.connections(), 2u);
}

class ConnectionsByDefault : public library_test {};

TEST_F(ConnectionsByDefault, ServeASingleRequest)
{
    plain_server.script(answer_all);

    for (int request = 0; request < 3; ++request)
        EXPECT_EQ(fetch(plain_server.base_url() + path).code, 200);

    EXPECT_EQ(plain_server.connections(), 3u);
    EXPECT_TRUE(plain_server.wait_until_idle());
}

} // namespace
} // namespace quillmere_test
