#include "http_server.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <ctime>
#include <future>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include <boost/asio/post.hpp>
#include <gtest/gtest.h>

#include "socket_client.h"
#include "times.h"

using namespace emulator;

namespace {

const std::string odd_request = "GET /odd HTTP/1.1\r\nHost: localhost\r\n\r\n";
const std::string status_request = "GET /echo HTTP/1.1\r\nHost: localhost\r\n\r\n";

/** A server with small limits that answers with what it was asked. */
class HttpServer : public testing::Test {
protected:
    void start(const server_limits &with)
    {
        const auto echo = [this](const request &asked) {
            ++answered;
            return reply{200,
                         asked.method + " " + asked.target + " " + asked.content_type + " [" +
                             asked.body + "]",
                         {},
                         {},
                         asked.target == "/odd" ? sending : delivery{}};
        };
        server.emplace(context, with,
                       request_handlers{echo, [](const request &) { return nullptr; }});
        port = server->listen(0, nullptr);
        thread = std::thread([this] { context.run(); });
    }

    ~HttpServer() override
    {
        boost::asio::post(context, [this] { server->stop(nullptr); });
        thread.join();
    }

    void wait_until_answered(int count) const
    {
        while (answered < count)
            std::this_thread::yield();
    }

    static server_limits small()
    {
        server_limits limits;
        limits.header_bytes = 1024;
        limits.body_bytes = 100;
        limits.connections = 2;
        return limits;
    }

    static std::string post(std::size_t length)
    {
        return "POST /p HTTP/1.1\r\nHost: localhost\r\nContent-Length: " + std::to_string(length) +
               "\r\n\r\n" + std::string(length, 'x');
    }

    boost::asio::io_context context{1};
    std::optional<http_server> server;
    std::uint16_t port = 0;
    std::atomic<int> answered{0};
    delivery sending; // of the reply to what is asked of /odd
    std::thread thread;
};

bool ends_with(const std::string &text, const std::string &end)
{
    return text.size() >= end.size() &&
           text.compare(text.size() - end.size(), end.size(), end) == 0;
}

} // namespace

TEST_F(HttpServer, AnswersManyRequestsOnOneConnection)
{
    start(small());
    socket_client client(port);

    for (int round = 0; round < 3; ++round) {
        client.send(status_request);
        const std::string reply = client.read_reply();
        EXPECT_EQ(reply.substr(0, 17), "HTTP/1.1 200 OK\r\n");
        EXPECT_TRUE(ends_with(reply, "GET /echo  []")) << reply;
    }
}

TEST_F(HttpServer, AnswersRequestsThatComeTogether)
{
    start(small());
    socket_client client(port);

    client.send(status_request + status_request);

    EXPECT_TRUE(ends_with(client.read_reply(), "GET /echo  []"));
    EXPECT_TRUE(ends_with(client.read_reply(), "GET /echo  []"));
}

TEST_F(HttpServer, AnswersARequestThatComesByteByByte)
{
    start(small());
    socket_client client(port);

    for (const char byte : status_request)
        client.send(std::string(1, byte));

    EXPECT_TRUE(ends_with(client.read_reply(), "GET /echo  []"));
}

TEST_F(HttpServer, ClosesWhenTheClientAsksForIt)
{
    start(small());
    socket_client client(port);

    client.send("GET /echo HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n\r\n");

    EXPECT_NE(client.read_to_end().find("Connection: close\r\n"), std::string::npos);
}

TEST_F(HttpServer, HeadGetsTheLengthWithoutTheBody)
{
    start(small());
    socket_client client(port);

    client.send("HEAD /echo HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n\r\n");

    const std::string reply = client.read_to_end();
    EXPECT_NE(reply.find("Content-Length: 14\r\n"), std::string::npos) << reply;
    EXPECT_TRUE(ends_with(reply, "\r\n\r\n"));
}

TEST_F(HttpServer, TellsTheTimeInEveryReply)
{
    start(small());
    const auto asked = std::time(nullptr);

    for (const std::string &request : {status_request, post(101)}) {
        socket_client client(port);
        client.send(request);
        const std::string reply = client.read_reply();

        std::vector<std::string> dates;
        for (auto second = asked; second <= std::time(nullptr); ++second)
            dates.push_back("\r\nDate: " + http_date(second) + "\r\n");
        EXPECT_TRUE(std::any_of(dates.begin(), dates.end(), [&](const std::string &date) {
            return reply.find(date) != std::string::npos;
        })) << reply;
    }
}

TEST_F(HttpServer, TakesABodyUpToItsLimit)
{
    start(small());
    socket_client client(port);

    client.send(post(100));

    EXPECT_TRUE(ends_with(client.read_reply(), "[" + std::string(100, 'x') + "]"));
}

TEST_F(HttpServer, RefusesABodyBeyondItsLimit)
{
    start(small());
    socket_client client(port);

    client.send(post(101));

    const std::string reply = client.read_to_end();
    EXPECT_EQ(reply.substr(0, 12), "HTTP/1.1 413") << reply;
    EXPECT_EQ(element(reply, "error"), "110");
}

TEST_F(HttpServer, TakesABodyInChunks)
{
    start(small());
    socket_client client(port);

    client.send("POST /p HTTP/1.1\r\nHost: h\r\nTransfer-Encoding: chunked\r\n\r\n"
                "3\r\nabc\r\n2\r\nde\r\n0\r\n\r\n");

    EXPECT_TRUE(ends_with(client.read_reply(), "[abcde]"));
}

TEST_F(HttpServer, RefusesChunksBeyondItsLimit)
{
    start(small());
    socket_client client(port);

    client.send("POST /p HTTP/1.1\r\nHost: h\r\nTransfer-Encoding: chunked\r\n\r\n" +
                ("65\r\n" + std::string(101, 'x') + "\r\n0\r\n\r\n"));

    const std::string reply = client.read_to_end();
    EXPECT_EQ(element(reply, "error"), "110") << reply;
}

TEST_F(HttpServer, RefusesAHeaderBeyondItsLimit)
{
    start(small());
    socket_client client(port);

    client.send("GET /" + std::string(2000, 'a') + " HTTP/1.1\r\nHost: h\r\n\r\n");

    const std::string reply = client.read_to_end();
    EXPECT_EQ(element(reply, "error"), "110") << reply;
}

TEST_F(HttpServer, RefusesWhatIsNotHttp)
{
    start(small());
    socket_client client(port);

    client.send("nonsense\r\n\r\n");

    const std::string reply = client.read_to_end();
    EXPECT_EQ(reply.substr(0, 12), "HTTP/1.1 400") << reply;
    EXPECT_EQ(element(reply, "error"), "103");
}

TEST_F(HttpServer, InvitesABodyThatWaitsToBeAskedFor)
{
    start(small());
    socket_client client(port);

    client.send("POST /p HTTP/1.1\r\nHost: h\r\nContent-Length: 3\r\nExpect: 100-continue\r\n\r\n");
    EXPECT_EQ(client.read_until("\r\n\r\n"), "HTTP/1.1 100 Continue\r\n\r\n");
    client.send("abc");

    EXPECT_TRUE(ends_with(client.read_reply(), "[abc]"));
}

TEST_F(HttpServer, SurvivesAClientThatLeavesInTheMiddle)
{
    start(small());
    for (std::size_t length = 0; length < status_request.size(); ++length) {
        socket_client client(port);
        client.send(status_request.substr(0, length));
        client.finish();
        EXPECT_EQ(client.read_to_end(), "") << length;
    }

    EXPECT_NE(get(port, "/echo"), "");
}

TEST_F(HttpServer, LetsConnectionsBeyondItsLimitWaitUntilOneEnds)
{
    start(small());
    std::optional<socket_client> first(port);
    socket_client second(port);
    first->send(status_request);
    first->read_reply();
    second.send(status_request);
    second.read_reply();
    socket_client third(port);
    third.send(status_request);
    // The server has one thread: had it taken the third, it would come to it between these.
    for (int round = 0; round < 20; ++round) {
        second.send(status_request);
        second.read_reply();
    }
    EXPECT_EQ(answered, 22);

    first.reset();

    EXPECT_TRUE(ends_with(third.read_reply(), "GET /echo  []"));
}

TEST_F(HttpServer, EndsAConnectionThatSendsNothing)
{
    server_limits limits = small();
    limits.idle_time = std::chrono::seconds(1);
    start(limits);
    socket_client client(port);

    EXPECT_EQ(client.read_to_end(), "");
}

TEST_F(HttpServer, EndsIdleConnectionsWhenItStops)
{
    start(small());
    socket_client client(port);
    client.send(status_request);
    client.read_reply();
    auto finished = std::make_shared<std::promise<void>>();

    boost::asio::post(context, [=] { server->stop([finished] { finished->set_value(); }); });

    // Far below the idle time, at which the connection would end anyway.
    EXPECT_EQ(finished->get_future().wait_for(std::chrono::seconds(10)), std::future_status::ready);
    EXPECT_EQ(client.read_to_end(), "");
    EXPECT_THROW(socket_client{port}, std::runtime_error);
}

TEST_F(HttpServer, ListensOnBothLoopbackAddressesWhereThereAreTwo)
{
    start(small());
    try {
        socket_client client(port, true);
        client.send(status_request);
        EXPECT_TRUE(ends_with(client.read_reply(), "GET /echo  []"));
    } catch (const std::runtime_error &) {
        GTEST_SKIP() << "this machine has no ::1";
    }
}

TEST_F(HttpServer, SaysThatAPortIsTaken)
{
    start(small());
    boost::asio::io_context other_context;
    http_server other(other_context, {}, {});

    EXPECT_THROW(other.listen(port, nullptr), std::runtime_error);
}

TEST_F(HttpServer, CutsAReplyBehindTheBytesItIsToldAndEndsTheConnection)
{
    sending = {delivery_kind::cut, 12};
    start(small());
    socket_client client(port);

    client.send(odd_request + status_request);

    EXPECT_EQ(client.read_to_end(), "HTTP/1.1 200");
    EXPECT_FALSE(client.was_reset());
    EXPECT_EQ(answered, 1);
}

TEST_F(HttpServer, EndsTheConnectionBehindAReplyThatIsShorterThanItsCut)
{
    sending = {delivery_kind::cut, 100000};
    start(small());
    socket_client client(port);

    client.send(odd_request);

    EXPECT_TRUE(ends_with(client.read_to_end(), "GET /odd  []"));
}

TEST_F(HttpServer, EndsTheConnectionWithoutAnyByteOfALostReply)
{
    sending = {delivery_kind::cut, 0};
    start(small());
    socket_client client(port);

    client.send(odd_request);

    EXPECT_EQ(client.read_to_end(), "");
    EXPECT_FALSE(client.was_reset());
    EXPECT_EQ(answered, 1);
}

TEST_F(HttpServer, TearsAConnectionDown)
{
    sending = {delivery_kind::reset};
    start(small());
    socket_client client(port);

    client.send(odd_request);

    EXPECT_EQ(client.read_to_end(), "");
    EXPECT_TRUE(client.was_reset());
}

TEST_F(HttpServer, AnswersLaterWithoutHoldingUpOthers)
{
    constexpr std::chrono::milliseconds delay{300};
    sending = {delivery_kind::whole, 0, delay};
    start(small());
    socket_client waiting(port);
    socket_client other(port);

    const auto begin = std::chrono::steady_clock::now();
    waiting.send(odd_request);
    waiting.send(status_request);
    other.send(status_request);
    EXPECT_TRUE(ends_with(other.read_reply(), "GET /echo  []"));
    EXPECT_TRUE(ends_with(waiting.read_reply(), "GET /odd  []"));

    EXPECT_GE(std::chrono::steady_clock::now() - begin, delay);
    EXPECT_TRUE(ends_with(waiting.read_reply(), "GET /echo  []"));
}

TEST_F(HttpServer, FinishesADelayedReplyAtOnceWhenItStops)
{
    sending = {delivery_kind::whole, 0, std::chrono::hours(1)};
    start(small());
    socket_client client(port);
    client.send(odd_request);
    wait_until_answered(1);

    boost::asio::post(context, [this] { server->stop(nullptr); });

    EXPECT_TRUE(ends_with(client.read_to_end(), "GET /odd  []"));
}

TEST_F(HttpServer, WithholdsAReplyUntilItStops)
{
    sending = {delivery_kind::withheld};
    start(small());
    socket_client client(port);
    client.send(odd_request);
    wait_until_answered(1);
    socket_client other(port);
    other.send(status_request);
    other.read_reply(); // the one thread has been through with the first by now
    EXPECT_TRUE(client.is_silent());

    boost::asio::post(context, [this] { server->stop(nullptr); });

    EXPECT_EQ(client.read_to_end(), "");
}

TEST_F(HttpServer, ForgetsAWithheldReplyWhenItsClientLeaves)
{
    server_limits limits = small();
    limits.connections = 1;
    sending = {delivery_kind::withheld};
    start(limits);
    std::optional<socket_client> client(port);
    client->send(odd_request);
    wait_until_answered(1);

    client.reset();

    EXPECT_NE(get(port, "/echo"), ""); // there is room for it again
}

TEST_F(HttpServer, ListensOnOneAddressAlone)
{
    start(small());
    boost::asio::io_context other_context;
    http_server other(other_context, {}, {});

    // On the first one the port is taken.
    EXPECT_EQ(other.listen({boost::asio::ip::make_address("127.0.0.2"), port}), port);
    EXPECT_THROW(other.listen({boost::asio::ip::make_address("127.0.0.1"), port}),
                 std::runtime_error);
}

TEST_F(HttpServer, ExplainsARefusalBehindAReplyThatHadNoBody)
{
    start(small());
    socket_client client(port);

    client.send("HEAD /echo HTTP/1.1\r\nHost: localhost\r\n\r\n");
    client.read_until("\r\n\r\n");
    client.send("nonsense\r\n\r\n");

    EXPECT_EQ(element(client.read_to_end(), "error"), "103");
}
