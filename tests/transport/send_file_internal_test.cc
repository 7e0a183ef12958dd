// What an upload connection asks of libcurl, of the clock and of the socket for every chunk, and
// what it does when these refuse.
#include <gmock/gmock.h>

#include <future>

#include "support/library_fixture.h"
#include "support/stdout_capture.h"
#include "transport/socket_calls.h"
#include "transport/upload_connection.h"

namespace quillmere_test {
namespace {

using testing::ElementsAre;

// Reading and writing, which differ in little.
struct direction {
    const char *name;
    short events;
    int32_t failed;
    int32_t (*move)(send_file *connection, char *bytes, uint64_t size);
    std::vector<chunk> socket_calls::*chunks;
};

void PrintTo(const direction &each, std::ostream *out) { *out << each.name; }

int32_t write_chunk(send_file *connection, char *bytes, uint64_t size)
{
    return send_file_write(connection, bytes, size);
}

int32_t read_chunk(send_file *connection, char *bytes, uint64_t size)
{
    return send_file_read(connection, bytes, size);
}

const direction directions[] = {
    {"write", POLLOUT, -6, write_chunk, &socket_calls::sent},
    {"read", POLLIN, -7, read_chunk, &socket_calls::received},
};

constexpr time_t now = 1'700'000'000;
constexpr const char *idled = "Error: Transmission timeout.\n";
constexpr const char *waited = "Error: Connection timeout.\n";
constexpr const char *again = "Error: wait_on_socket failed.\n";

std::string error_line(CURLcode code)
{
    return "Error: " + std::to_string(code) + " " + curl_easy_strerror(code) + "\n";
}

class Chunk : public testing::TestWithParam<direction> {
protected:
    static constexpr int descriptor_number = 987;

    Chunk()
    {
        socket.clock = now;
        socket.wait = [](size_t) { return 1; };
        socket.move = [](size_t, size_t *moved) {
            *moved = 3;
            return CURLE_OK;
        };
    }

    void idle_for(time_t seconds) { connection.last_transmission = now - seconds; }
    int32_t move(uint64_t size = 5) { return GetParam().move(&connection, bytes, size); }
    size_t moves() const { return (socket.*GetParam().chunks).size(); }
    socket_wait wait_of(int milliseconds) const
    {
        return {descriptor_number, GetParam().events, milliseconds};
    }

    // The first results of libcurl, then success.
    void answer_first(std::vector<CURLcode> codes)
    {
        socket.move = [codes](size_t call, size_t *moved) {
            *moved = call <= codes.size() ? 0 : 3;
            return call <= codes.size() ? codes[call - 1] : CURLE_OK;
        };
    }

    char bytes[5] = {'h', 'e', 'l', 'l', 'o'};
    send_file connection = {nullptr, 0, descriptor_number, now - 10};
    socket_calls socket;
    stdout_capture output;
};

INSTANTIATE_TEST_SUITE_P(Both, Chunk, testing::ValuesIn(directions));

TEST_P(Chunk, IsMovedAfterAWaitForTheSocket)
{
    EXPECT_EQ(move(), 3);

    EXPECT_EQ(socket.order, "wm");
    EXPECT_THAT(socket.waits, ElementsAre(wait_of(50'000)));
    EXPECT_THAT(socket.*GetParam().chunks, ElementsAre(chunk{bytes, 5}));
    EXPECT_EQ(connection.last_transmission, now);
    EXPECT_EQ(output.text(), "");
}

TEST_P(Chunk, WaitsForWhatTheIdleTimeHasLeft)
{
    for (int seconds : {0, 1, 59, 60}) {
        SCOPED_TRACE(seconds);
        socket.waits.clear();
        idle_for(seconds);

        EXPECT_EQ(move(), 3);

        EXPECT_THAT(socket.waits, ElementsAre(wait_of(60'000 - seconds * 1000)));
    }
    EXPECT_EQ(output.text(), "");
}

TEST_P(Chunk, FailsAfterMoreThanAMinute)
{
    idle_for(61);

    EXPECT_EQ(move(), -5);

    EXPECT_EQ(socket.order, "");
    EXPECT_EQ(output.text(), idled);
    EXPECT_EQ(connection.last_transmission, now - 61);
}

TEST_P(Chunk, FailsIfTheTimeWasNeverSet)
{
    connection.last_transmission = 0;

    EXPECT_EQ(move(), -5);
    EXPECT_EQ(output.text(), idled);
}

TEST_P(Chunk, WaitsAMinuteIfTheClockCannotBeRead)
{
    idle_for(61);
    socket.clock = -1;

    EXPECT_EQ(move(), 3);

    EXPECT_THAT(socket.waits, ElementsAre(wait_of(60'000)));
    EXPECT_EQ(connection.last_transmission, now - 61);
    EXPECT_EQ(output.text(), "");
}

// A wait must not become endless when someone sets the clock.
TEST_P(Chunk, WaitsAMinuteAtMostIfTheClockWasSetBack)
{
    idle_for(-100 * 24 * 3600);

    EXPECT_EQ(move(), 3);

    EXPECT_THAT(socket.waits, ElementsAre(wait_of(60'000)));
}

TEST_P(Chunk, FailsIfTheSocketIsNotReadyInTime)
{
    socket.wait = [](size_t) { return 0; };

    EXPECT_EQ(move(), -5);

    EXPECT_EQ(socket.order, "w");
    EXPECT_EQ(output.text(), waited);
    EXPECT_EQ(connection.last_transmission, now - 10);
}

TEST_P(Chunk, IsMovedEvenIfTheWaitFails)
{
    socket.wait = [](size_t) { return -1; };

    EXPECT_EQ(move(), 3);
    EXPECT_EQ(output.text(), "");
}

TEST_P(Chunk, IsMovedWithAWaitAPauseAndALineForEveryRetry)
{
    answer_first({CURLE_AGAIN, CURLE_AGAIN, CURLE_AGAIN});

    EXPECT_EQ(move(), 3);

    EXPECT_EQ(socket.order, "wmwpmwpmwpm");
    EXPECT_THAT(socket.pauses_nanoseconds, ElementsAre(10'000'000, 10'000'000, 10'000'000));
    EXPECT_THAT(socket.*GetParam().chunks,
                ElementsAre(chunk{bytes, 5}, chunk{bytes, 5}, chunk{bytes, 5}, chunk{bytes, 5}));
    EXPECT_EQ(output.text(), std::string(again) + again + again);
    EXPECT_EQ(connection.last_transmission, now);
}

TEST_P(Chunk, WaitsForLessBeforeARetryLater)
{
    socket.move = [&](size_t call, size_t *moved) {
        *moved = 3;
        socket.clock = now + 20;
        return call == 1 ? CURLE_AGAIN : CURLE_OK;
    };

    EXPECT_EQ(move(), 3);

    EXPECT_THAT(socket.waits, ElementsAre(wait_of(50'000), wait_of(30'000)));
    EXPECT_EQ(connection.last_transmission, now + 20);
}

TEST_P(Chunk, IsNotRetriedAfterMoreThanAMinute)
{
    socket.move = [&](size_t, size_t *) {
        socket.clock = now + 51;
        return CURLE_AGAIN;
    };

    EXPECT_EQ(move(), -5);

    EXPECT_EQ(socket.order, "wm");
    EXPECT_EQ(output.text(), std::string(again) + idled);
}

TEST_P(Chunk, IsNotRetriedIfTheSocketIsNotReadyAgainInTime)
{
    answer_first({CURLE_AGAIN});
    socket.wait = [](size_t call) { return call == 1 ? 1 : 0; };

    EXPECT_EQ(move(), -5);

    EXPECT_EQ(socket.order, "wmw");
    EXPECT_EQ(output.text(), std::string(again) + waited);
}

TEST_P(Chunk, FailsWithAnyOtherCodeAtOnce)
{
    for (CURLcode code : {CURLE_SEND_ERROR, CURLE_RECV_ERROR, CURLE_UNSUPPORTED_PROTOCOL,
                          CURLE_BAD_FUNCTION_ARGUMENT, CURLE_GOT_NOTHING}) {
        SCOPED_TRACE(code);
        std::string before = output.text();
        answer_first({code});
        (socket.*GetParam().chunks).clear();

        EXPECT_EQ(move(), GetParam().failed);

        EXPECT_EQ(output.text(), before + error_line(code));
    }
    EXPECT_EQ(connection.last_transmission, now - 10);
}

TEST_P(Chunk, MayFailAfterARetry)
{
    answer_first({CURLE_AGAIN, CURLE_SEND_ERROR});

    EXPECT_EQ(move(), GetParam().failed);

    EXPECT_EQ(output.text(), again + error_line(CURLE_SEND_ERROR));
}

TEST_P(Chunk, OfNothingLeavesTheTime)
{
    socket.move = [](size_t, size_t *moved) {
        *moved = 0;
        return CURLE_OK;
    };

    EXPECT_EQ(move(), 0);
    EXPECT_EQ(connection.last_transmission, now - 10);
}

TEST_P(Chunk, OfOneByteSetsTheTime)
{
    socket.move = [](size_t, size_t *moved) {
        *moved = 1;
        return CURLE_OK;
    };

    EXPECT_EQ(move(), 1);
    EXPECT_EQ(connection.last_transmission, now);
}

// libcurl is not asked: to an empty send it would answer "again" for ever.
TEST_P(Chunk, OfNoBytesIsOverAfterTheFirstWait)
{
    socket.move = [](size_t, size_t *) { return CURLE_RECV_ERROR; };

    EXPECT_EQ(move(0), 0);

    EXPECT_EQ(socket.order, "w");
    EXPECT_EQ(connection.last_transmission, now - 10);
    EXPECT_EQ(output.text(), "");
}

TEST_P(Chunk, OfNoBytesFailsAfterMoreThanAMinuteToo)
{
    idle_for(61);

    EXPECT_EQ(move(0), -5);
    EXPECT_EQ(output.text(), idled);
}

TEST_P(Chunk, OfNoBytesFailsIfTheSocketIsNotReadyInTime)
{
    socket.wait = [](size_t) { return 0; };

    EXPECT_EQ(move(0), -5);
    EXPECT_EQ(output.text(), waited);
}

class LastTransmission : public testing::Test {
protected:
    send_file connection = {nullptr, 0, -1, now - 10};
    socket_calls socket;
};

TEST_F(LastTransmission, WasSoManySecondsAgo)
{
    socket.clock = now;

    EXPECT_EQ(send_file_seconds_since_last_transmission(&connection), 10u);
    EXPECT_EQ(connection.last_transmission, now - 10);
}

TEST_F(LastTransmission, WasJustNowIfTheClockCannotBeRead)
{
    socket.clock = -1;

    EXPECT_EQ(send_file_seconds_since_last_transmission(&connection), 0u);
}

TEST_F(LastTransmission, IsBroughtUpToDate)
{
    socket.clock = now;

    EXPECT_EQ(send_file_update_connection_last_timestamp(&connection), now);
    EXPECT_EQ(connection.last_transmission, now);
}

TEST_F(LastTransmission, StaysIfTheClockCannotBeRead)
{
    socket.clock = -1;

    EXPECT_EQ(send_file_update_connection_last_timestamp(&connection), -1);
    EXPECT_EQ(connection.last_transmission, now - 10);
}

// Real connections under a clock that stands still, a minute after the last transmission: the wait
// ends at once, and yet every byte goes where it should.
class MinuteLater : public library_test {
protected:
    MinuteLater() { socket.clock = now; }

    owned_connection connect_to(const scripted_server &peer)
    {
        opened result = open_connection((peer.base_url() + "/").c_str(), 0, 10);
        EXPECT_EQ(result.result, 0);
        return std::move(result.connection);
    }

    socket_calls socket;
    stdout_capture output;
};

TEST_F(MinuteLater, AFullSendBufferIsATimeout)
{
    std::promise<void> full;
    std::string arrived;
    plain_server.script([&](connection &client) {
        full.get_future().wait();
        for (std::string some = client.read_some(); !some.empty(); some = client.read_some())
            arrived += some;
    });
    owned_connection connection = connect_to(plain_server);
    const std::string piece(1024 * 1024, 'u');
    size_t sent = 0;

    int32_t written = 0;
    do {
        connection->last_transmission = now - 60;
        written = send_file_write(connection.get(), piece.data(), piece.size());
        sent += written > 0 ? static_cast<size_t>(written) : 0;
    } while (written > 0);
    EXPECT_EQ(written, -5);
    EXPECT_EQ(output.text(), waited);

    // The connection still stands, and goes on as soon as there is room.
    send_file_update_connection_last_timestamp(connection.get());
    full.set_value();
    EXPECT_EQ(write_all(connection.get(), "the end"), "");
    connection.reset();
    EXPECT_TRUE(plain_server.wait_until_idle());
    EXPECT_EQ(arrived, std::string(sent, 'u') + "the end");
    EXPECT_EQ(output.text(), waited);
}

TEST_F(MinuteLater, ASilentPeerIsATimeout)
{
    plain_server.script([](connection &client) { client.stall(); });
    owned_connection connection = connect_to(plain_server);
    connection->last_transmission = now - 60;
    char byte = 0;

    EXPECT_EQ(send_file_read(connection.get(), &byte, 1), -5);

    EXPECT_EQ(output.text(), waited);
    EXPECT_EQ(connection->last_transmission, now - 60);
}

TEST_F(MinuteLater, AWriteStillPasses)
{
    plain_server.script([](connection &client) { client.stall(); });
    owned_connection connection = connect_to(plain_server);
    connection->last_transmission = now - 60;

    EXPECT_EQ(send_file_write(connection.get(), "hello", 5), 5);

    EXPECT_EQ(output.text(), "");
    EXPECT_EQ(connection->last_transmission, now);
}

} // namespace
} // namespace quillmere_test
