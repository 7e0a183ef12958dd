// The relay itself: it must cut where it is told, or the tests that cut prove nothing.
#include "support/cutting_relay.h"

#include <arpa/inet.h>
#include <sys/socket.h>

#include <string>

#include <gtest/gtest.h>

#include "support/failure.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

/** What a client receives through the relay that sends these bytes and reads to the end. */
std::string received_through(const cutting_relay &relay, const std::string &bytes)
{
    const descriptor client(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_port = htons(relay.port());
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    require(::connect(client.number(), reinterpret_cast<const sockaddr *>(&address),
                      sizeof address) == 0,
            "connect");
    require(::send(client.number(), bytes.data(), bytes.size(), MSG_NOSIGNAL) >= 0, "send");
    std::string received;
    char piece[1024];
    for (ssize_t got; (got = ::recv(client.number(), piece, sizeof piece, 0)) > 0;)
        received.append(piece, static_cast<size_t>(got));
    return received;
}

class CuttingRelay : public testing::Test {
protected:
    CuttingRelay()
    {
        server.script([this](connection &client) {
            arrived = client.read_some();
            client.send("an answer");
        });
    }

    std::string arrived;
    scripted_server server;
    cutting_relay relay{server.port()};
};

TEST_F(CuttingRelay, LetsEverythingThroughUnlessItIsToldToCut)
{
    EXPECT_EQ(received_through(relay, "a question"), "an answer");
    ASSERT_TRUE(server.wait_until_idle());
    EXPECT_EQ(arrived, "a question");
    EXPECT_EQ(relay.cuts(), 0u);
}

TEST_F(CuttingRelay, CutsWhatGoesToTheServer)
{
    relay.cut_after(way::to_server, 4);

    EXPECT_EQ(received_through(relay, "a question"), "");
    ASSERT_TRUE(server.wait_for_connections(1));
    ASSERT_TRUE(server.wait_until_idle());
    EXPECT_EQ(arrived, "a qu");
    EXPECT_EQ(relay.cuts(), 1u);
}

TEST_F(CuttingRelay, CutsWhatGoesToTheClient)
{
    relay.cut_after(way::to_client, 5);

    EXPECT_EQ(received_through(relay, "a question"), "an an");
    EXPECT_EQ(relay.cuts(), 1u);

    relay.cut_nothing();
    EXPECT_EQ(received_through(relay, "a question"), "an answer");
}

} // namespace
} // namespace quillmere_test
