// A peer that goes away in the middle of an upload must not end the program.
#include "support/library_fixture.h"
#include "transport/exchange.h"
#include "transport/pipe_signals.h"

namespace quillmere_test {
namespace {

struct departure {
    const char *name;
    void (*leave)(connection &client);
};

void PrintTo(const departure &each, std::ostream *out) { *out << each.name; }

// A client holds a large body back until it is asked for it.
void ask_for_the_body(connection &client)
{
    std::string head;
    while (head.find("\r\n\r\n") == std::string::npos)
        head += client.read_some();
    client.send("HTTP/1.1 100 Continue\r\n\r\n");
}

void take_pieces(connection &client, int count)
{
    ask_for_the_body(client);
    for (int i = 0; i < count; ++i)
        client.read_some();
}

void close_after_a_piece(connection &client)
{
    take_pieces(client, 1);
    client.close();
}

void reset_after_a_piece(connection &client)
{
    take_pieces(client, 1);
    client.reset();
}

void reset_after_many_pieces(connection &client)
{
    take_pieces(client, 50);
    client.reset();
}

void reset_at_once(connection &client) { client.reset(); }

class PeerLeavesDuringAPost : public library_test,
                              public testing::WithParamInterface<std::tuple<departure, bool>> {};

TEST_P(PeerLeavesDuringAPost, WithoutASignalToTheProgram)
{
    const auto &[how, with_tls] = GetParam();
    scripted_server &peer = with_tls ? server : plain_server;
    peer.script(how.leave);
    set_connection_attempts(10);
    const std::string body(16 * 1024 * 1024, 'u');
    pipe_signal_counter signals;

    exchange result = fetch(peer.base_url() + "/a/path/of/some/length", post_of(body));

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(peer.connections(), 10u);
    EXPECT_EQ(signals.count(), 0);
}

INSTANTIATE_TEST_SUITE_P(
    Departures, PeerLeavesDuringAPost,
    testing::Combine(testing::Values(departure{"closes after a piece", close_after_a_piece},
                                     departure{"resets after a piece", reset_after_a_piece},
                                     departure{"resets at once", reset_at_once},
                                     departure{"resets after many", reset_after_many_pieces}),
                     testing::Bool()));

TEST(PipeSignalCounter, Counts)
{
    pipe_signal_counter signals;

    raise(SIGPIPE);

    EXPECT_EQ(signals.count(), 1);
}

class Sigpipe : public library_test {};

TEST_F(Sigpipe, KeepsItsDispositionDuringAnExchange)
{
    struct sigaction before = {};
    sigaction(SIGPIPE, nullptr, &before);
    server.answer(http_reply(200, "here"));

    fetch(server.base_url() + "/a/path/of/some/length");

    struct sigaction after = {};
    sigaction(SIGPIPE, nullptr, &after);
    EXPECT_EQ(after.sa_handler, before.sa_handler);
}

} // namespace
} // namespace quillmere_test
