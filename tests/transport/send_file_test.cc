// The upload connection with real peers, plain and with TLS, that behave and that do not.
#include <curl/curl.h>
#include <poll.h>
#include <sys/socket.h>

#include <array>
#include <ctime>

#include "support/failure.h"
#include "transport/pipe_signals.h"
#include "transport/upload_fixture.h"

namespace quillmere_test {
namespace {

std::string error_line(CURLcode code)
{
    return "Error: " + std::to_string(code) + " " + curl_easy_strerror(code) + "\n";
}

// Until the other end's close or reset has arrived.
void wait_for_hangup(const send_file *connection)
{
    pollfd wait = {connection->socket, POLLRDHUP, 0};
    ::poll(&wait, 1, milliseconds_until(std::chrono::steady_clock::now() + patience));
    EXPECT_NE(wait.revents, 0);
}

class Upload : public upload_test, public testing::WithParamInterface<bool> {
protected:
    void SetUp() override
    {
        if (!with_tls())
            peer = std::make_unique<scripted_server>();
        else if (!start_tls(certificate_of_this_process()))
            GTEST_SKIP() << not_permitted;
    }

    bool with_tls() const { return GetParam(); }
    std::string url() const { return peer->base_url() + "/upload?type=desktop"; }

    owned_connection connect(int64_t timeout = 10)
    {
        opened result = open_connection(url().c_str(), with_tls() ? 1 : 0, timeout);
        EXPECT_EQ(result.result, 0) << output.text();
        return std::move(result.connection);
    }

    static std::string post_of_bytes(const std::string &body)
    {
        return "POST /upload?type=desktop HTTP/1.1\r\nHost: here\r\nContent-Length: " +
               std::to_string(body.size()) + "\r\n\r\n" + body;
    }
};

INSTANTIATE_TEST_SUITE_P(PlainAndTls, Upload, testing::Bool());

TEST_P(Upload, CarriesARequestAndItsReply)
{
    peer->answer(xml_reply("<response><result>0</result><key>abc</key></response>"));
    owned_connection connection = connect();

    EXPECT_EQ(write_all(connection.get(), post_of_bytes("hello")), "");
    whole_reply reply = read_all(connection.get());

    EXPECT_EQ(reply.last_result, 0);
    EXPECT_EQ(reply.bytes, xml_reply("<response><result>0</result><key>abc</key></response>"));
    ASSERT_EQ(peer->requests().size(), 1u);
    EXPECT_EQ(peer->requests()[0].head + peer->requests()[0].body, post_of_bytes("hello"));
    char *key = nullptr;
    EXPECT_EQ(parse_upload_response(reply.bytes.data(), reply.bytes.size(), &key), 0);
    EXPECT_STREQ(key, "abc");
    api_free(key);
    EXPECT_EQ(printed(), "");
    EXPECT_EQ(log.text(), "");
}

TEST_P(Upload, MovesALargeBodyChunkByChunk)
{
    std::string body(16 * 1024 * 1024, '\0');
    for (size_t index = 0; index < body.size(); ++index)
        body[index] = static_cast<char>(index * 31 >> 3);
    peer->answer(http_reply(200, ""));
    owned_connection connection = connect();
    const std::string bytes = post_of_bytes(body);

    int32_t first = send_file_write(connection.get(), bytes.data(), bytes.size());
    ASSERT_GT(first, 0);
    // TLS takes a chunk whole, in as many retries as it needs.
    EXPECT_EQ(static_cast<size_t>(first) < bytes.size(), !with_tls());
    EXPECT_EQ(
        write_all(connection.get(), std::string_view(bytes).substr(static_cast<size_t>(first))),
        "");

    EXPECT_EQ(read_all(connection.get()).bytes, http_reply(200, ""));
    ASSERT_EQ(peer->requests().size(), 1u);
    EXPECT_TRUE(peer->requests()[0].body == body);
    EXPECT_EQ(printed(), "");
}

TEST_P(Upload, ReadsALargeReplyWhole)
{
    const std::string reply = http_reply(200, std::string(4 * 1024 * 1024, 'r'));
    peer->answer(reply);
    owned_connection connection = connect();
    write_all(connection.get(), post_of_bytes(""));

    whole_reply read = read_all(connection.get());

    EXPECT_EQ(read.last_result, 0);
    EXPECT_TRUE(read.bytes == reply);
    EXPECT_EQ(printed(), "");
}

TEST_P(Upload, ReadsAReplyThatComesByteByByte)
{
    const std::string reply = http_reply(200, "slowly");
    peer->script([&](connection &client) {
        client.read_request();
        client.send_in_pieces(reply, 1);
    });
    owned_connection connection = connect();
    write_all(connection.get(), post_of_bytes(""));

    EXPECT_EQ(read_all(connection.get()).bytes, reply);
    EXPECT_EQ(printed(), "");
}

TEST_P(Upload, GoesOnInBothDirections)
{
    peer->script([](connection &client) {
        for (std::string some = client.read_some(); !some.empty(); some = client.read_some())
            client.send(some);
    });
    owned_connection connection = connect();
    std::array<char, 16 * 1024> buffer;

    for (const std::string word : {"one", "two", "three"}) {
        EXPECT_EQ(write_all(connection.get(), word), "");
        std::string back;
        while (back.size() < word.size()) {
            int32_t count = send_file_read(connection.get(), buffer.data(), buffer.size());
            ASSERT_GT(count, 0);
            back.append(buffer.data(), static_cast<size_t>(count));
        }
        EXPECT_EQ(back, word);
    }
    EXPECT_EQ(printed(), "");
}

TEST_P(Upload, HoldsItsSocketAndItsTimeout)
{
    const time_t before = std::time(nullptr);

    owned_connection connection = connect(0);

    ASSERT_TRUE(connection);
    EXPECT_NE(connection->handle, nullptr);
    EXPECT_EQ(connection->timeout, 0);
    EXPECT_GE(connection->last_transmission, before);
    EXPECT_LE(connection->last_transmission, std::time(nullptr));
    sockaddr_storage address = {};
    socklen_t length = sizeof address;
    EXPECT_EQ(::getpeername(connection->socket, reinterpret_cast<sockaddr *>(&address), &length),
              0);
    EXPECT_LT(send_file_seconds_since_last_transmission(connection.get()), 60u);
}

TEST_P(Upload, KeepsANegativeTimeoutAsItWasGiven) { EXPECT_EQ(connect(-7)->timeout, -7); }

TEST_P(Upload, NotesWhenBytesMoved)
{
    peer->answer(http_reply(200, ""));
    owned_connection connection = connect();
    const time_t before = std::time(nullptr);

    connection->last_transmission = before - 30;
    write_all(connection.get(), post_of_bytes("hello"));
    EXPECT_GE(connection->last_transmission, before);

    connection->last_transmission = before - 30;
    std::array<char, 16 * 1024> buffer;
    EXPECT_GT(send_file_read(connection.get(), buffer.data(), buffer.size()), 0);
    EXPECT_GE(connection->last_transmission, before);
}

TEST_P(Upload, WritesNothingOfNoBytes)
{
    peer->answer(http_reply(200, ""));
    owned_connection connection = connect();
    const time_t before = std::time(nullptr) - 30;
    connection->last_transmission = before;

    EXPECT_EQ(send_file_write(connection.get(), "hello", 0), 0);

    EXPECT_EQ(connection->last_transmission, before);
    EXPECT_EQ(write_all(connection.get(), post_of_bytes("whole")), "");
    EXPECT_EQ(read_all(connection.get()).last_result, 0);
    EXPECT_EQ(peer->requests().at(0).body, "whole");
    EXPECT_EQ(printed(), "");
}

TEST_P(Upload, FailsAfterMoreThanAMinuteAndMayGoOn)
{
    peer->answer(http_reply(200, ""));
    owned_connection connection = connect();
    char byte = 0;

    connection->last_transmission = std::time(nullptr) - 61;
    EXPECT_EQ(send_file_write(connection.get(), "hello", 5), -5);
    EXPECT_EQ(send_file_read(connection.get(), &byte, 1), -5);
    EXPECT_EQ(output.text(), "Error: Transmission timeout.\nError: Transmission timeout.\n");

    EXPECT_GT(send_file_update_connection_last_timestamp(connection.get()), 0);
    EXPECT_EQ(write_all(connection.get(), post_of_bytes("hello")), "");
    EXPECT_EQ(read_all(connection.get()).bytes, http_reply(200, ""));
}

TEST_P(Upload, EndsWhenThePeerCloses)
{
    peer->script([](connection &client) {
        client.read_some();
        client.close();
    });
    owned_connection connection = connect();
    write_all(connection.get(), "x");
    const time_t before = std::time(nullptr) - 30;
    connection->last_transmission = before;
    std::array<char, 16 * 1024> buffer;

    EXPECT_EQ(send_file_read(connection.get(), buffer.data(), buffer.size()), 0);
    EXPECT_EQ(send_file_read(connection.get(), buffer.data(), buffer.size()), 0);

    EXPECT_EQ(connection->last_transmission, before);
    EXPECT_EQ(printed(), "");
}

void reset_after_a_byte(connection &client)
{
    client.read_some();
    client.reset();
}

TEST_P(Upload, FailsToReadFromAPeerThatResets)
{
    peer->script(reset_after_a_byte);
    owned_connection connection = connect();
    write_all(connection.get(), "x");
    wait_for_hangup(connection.get());
    const time_t before = std::time(nullptr) - 30;
    connection->last_transmission = before;
    std::array<char, 16 * 1024> buffer;

    EXPECT_EQ(send_file_read(connection.get(), buffer.data(), buffer.size()), -7);

    EXPECT_EQ(printed(), error_line(CURLE_RECV_ERROR));
    EXPECT_EQ(connection->last_transmission, before);
}

TEST_P(Upload, FailsToWriteToAPeerThatResetsWithoutASignal)
{
    pipe_signal_counter signals;
    peer->script(reset_after_a_byte);
    owned_connection connection = connect();
    write_all(connection.get(), "x");
    wait_for_hangup(connection.get());

    EXPECT_EQ(send_file_write(connection.get(), "hello", 5), -6);
    EXPECT_EQ(send_file_write(connection.get(), "hello", 5), -6);
    connection.reset();

    EXPECT_EQ(printed(), error_line(CURLE_SEND_ERROR) + error_line(CURLE_SEND_ERROR));
    EXPECT_EQ(signals.count(), 0);
}

TEST_P(Upload, FailsInTheMiddleOfABodyWithoutASignal)
{
    pipe_signal_counter signals;
    peer->script([](connection &client) {
        for (int piece = 0; piece < 20; ++piece)
            client.read_some();
        client.reset();
    });
    owned_connection connection = connect();
    const std::string body(64 * 1024 * 1024, 'u');

    EXPECT_NE(write_all(connection.get(), body), "");
    EXPECT_EQ(send_file_write(connection.get(), "hello", 5), -6);
    connection.reset();

    EXPECT_EQ(printed(), error_line(CURLE_SEND_ERROR) + error_line(CURLE_SEND_ERROR));
    EXPECT_EQ(signals.count(), 0);
}

TEST_P(Upload, IsClosedWhenItIsDeleted)
{
    peer->script([](connection &client) { client.wait_for_peer_close(); });
    send_file *connection = connect().release();

    send_file_delete(&connection);

    EXPECT_EQ(connection, nullptr);
    EXPECT_TRUE(peer->wait_until_idle());
    EXPECT_EQ(output.text(), "");
}

TEST_P(Upload, GoesToThePeerItselfWhateverTheProxyIs)
{
    refused_port proxy;
    set_user_proxy("127.0.0.1", proxy.port(), nullptr, nullptr);
    proxy_server.enabled = 1;
    peer->answer(http_reply(200, ""));

    owned_connection connection = connect();

    ASSERT_TRUE(connection);
    write_all(connection.get(), post_of_bytes(""));
    EXPECT_EQ(read_all(connection.get()).bytes, http_reply(200, ""));
    EXPECT_EQ(peer->requests().at(0).target, "/upload?type=desktop");
}

TEST_P(Upload, MayBeOneOfSeveralOnAsManyThreads)
{
    peer->answer_with([](const request &arrived) { return http_reply(200, arrived.body); });
    // All of them stand before the first byte moves.
    std::vector<owned_connection> connections;
    for (int each = 0; each < 4; ++each)
        connections.push_back(connect());
    std::vector<std::string> replies(connections.size());
    std::vector<std::thread> threads;

    for (size_t each = 0; each < connections.size(); ++each)
        threads.emplace_back([&, each] {
            write_all(connections[each].get(), post_of_bytes(std::string(1'000'000 + each, 'u')));
            replies[each] = read_all(connections[each].get()).bytes;
        });
    for (std::thread &each : threads)
        each.join();

    for (size_t each = 0; each < replies.size(); ++each)
        EXPECT_TRUE(replies[each] == http_reply(200, std::string(1'000'000 + each, 'u')));
    EXPECT_EQ(printed(), "");
}

} // namespace
} // namespace quillmere_test
