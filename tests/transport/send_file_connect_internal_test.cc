// What the upload connection asks of libcurl when it connects, and what it does when libcurl
// refuses.
#include <gmock/gmock.h>

#include "support/library_fixture.h"
#include "support/stdout_capture.h"
#include "transport/easy_calls.h"
#include "transport/socket_calls.h"
#include "transport/upload_connection.h"

namespace quillmere_test {
namespace {

using testing::ElementsAre;

constexpr const char *upload_url = "https://service.example:8443/a/path";

class ConnectionOptions : public library_test {
protected:
    ConnectionOptions()
    {
        calls.perform = [](size_t) { return CURLE_OK; };
    }

    easy_calls calls;
};

TEST_F(ConnectionOptions, StandInTheirOrderWithoutTls)
{
    opened result = open_connection(upload_url, 0, 0);

    EXPECT_EQ(result.result, 0);
    EXPECT_THAT(calls.names(), ElementsAre(CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL,
                                           CURLOPT_TIMEOUT, CURLOPT_CONNECT_ONLY));
    EXPECT_EQ(calls.last(CURLOPT_URL).text, upload_url);
    EXPECT_EQ(calls.last(CURLOPT_FOLLOWLOCATION).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_NOSIGNAL).number, 1);
    EXPECT_EQ(calls.last(CURLOPT_CONNECT_ONLY).number, 1);
    EXPECT_EQ(calls.performances, 1u);
}

TEST_F(ConnectionOptions, HavePort443AndTheCertificatesWithTls)
{
    open_connection(upload_url, 1, 0);

    EXPECT_THAT(calls.names(memory_options),
                ElementsAre(CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_TIMEOUT,
                            CURLOPT_PORT, CURLOPT_USE_SSL, CURLOPT_SSL_SESSIONID_CACHE,
                            CURLOPT_CAINFO, CURLOPT_CONNECT_ONLY));
    EXPECT_EQ(calls.last(CURLOPT_PORT).number, 443);
    EXPECT_EQ(calls.last(CURLOPT_USE_SSL).number, 3);
    EXPECT_EQ(calls.last(CURLOPT_SSL_SESSIONID_CACHE).number, 0);
    EXPECT_EQ(calls.last(CURLOPT_CAINFO).text, test_root_path());
}

TEST_F(ConnectionOptions, LeaveTheHostNameVerifiedWithoutCertificates)
{
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);

    open_connection(upload_url, -1, 0);

    EXPECT_THAT(calls.names(),
                ElementsAre(CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_TIMEOUT,
                            CURLOPT_PORT, CURLOPT_USE_SSL, CURLOPT_SSL_SESSIONID_CACHE,
                            CURLOPT_SSL_VERIFYPEER, CURLOPT_CONNECT_ONLY));
    EXPECT_EQ(calls.last(CURLOPT_SSL_VERIFYPEER).number, 0);
}

TEST_F(ConnectionOptions, AreNotChangedByTheProxyAndSslDisabled)
{
    set_user_proxy("proxy.example", 3128, "user", "password");
    proxy_server.enabled = 1;
    ssl_disabled = 1;

    open_connection(upload_url, 1, 0);

    EXPECT_THAT(calls.names(memory_options),
                ElementsAre(CURLOPT_URL, CURLOPT_FOLLOWLOCATION, CURLOPT_NOSIGNAL, CURLOPT_TIMEOUT,
                            CURLOPT_PORT, CURLOPT_USE_SSL, CURLOPT_SSL_SESSIONID_CACHE,
                            CURLOPT_CAINFO, CURLOPT_CONNECT_ONLY));
}

class ConnectionTimeout : public ConnectionOptions,
                          public testing::WithParamInterface<timeout_case> {};

TEST_P(ConnectionTimeout, IsAMinuteUnlessItIsPositiveAndKeptAsGiven)
{
    set_default_timeout(5); // for the operations alone

    opened result = open_connection(upload_url, 0, GetParam().given);

    EXPECT_EQ(calls.last(CURLOPT_TIMEOUT).number, GetParam().used);
    ASSERT_EQ(result.result, 0);
    EXPECT_EQ(result.connection->timeout, GetParam().given);
}

INSTANTIATE_TEST_SUITE_P(All, ConnectionTimeout,
                         testing::Values(timeout_case{0, 60}, timeout_case{-1, 60},
                                         timeout_case{INT64_MIN, 60}, timeout_case{1, 1},
                                         timeout_case{59, 59}, timeout_case{3600, 3600}));

class ConnectionFailure : public ConnectionOptions {
protected:
    stdout_capture output;
};

TEST_F(ConnectionFailure, IsALackOfMemoryForTheCertificates)
{
    calls.refused = CURLOPT_CAINFO; // libcurl would trust certificates of its own choice
    calls.refusal = CURLE_OUT_OF_MEMORY;

    opened result = open_connection(upload_url, 1, 5);

    EXPECT_EQ(result.result, -1);
    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(output.text(), "Curl error: Out of memory\n");
}

TEST_F(ConnectionFailure, OfTheHandleIsItsOwn)
{
    calls.failing_inits = 1;

    EXPECT_EQ(open_connection(upload_url, 1, 0).result, -200);

    EXPECT_EQ(calls.performances, 0u);
    EXPECT_EQ(output.text(), "");
    EXPECT_EQ(log.text(), "");
}

TEST_F(ConnectionFailure, IsPrintedAndCleanedUp)
{
    calls.perform = [](size_t) { return CURLE_PEER_FAILED_VERIFICATION; };

    EXPECT_EQ(open_connection(upload_url, 1, 0).result, -1);

    EXPECT_EQ(calls.cleanups, 1u);
    EXPECT_EQ(output.text(), std::string("Curl error: ") +
                                 curl_easy_strerror(CURLE_PEER_FAILED_VERIFICATION) + "\n");
    EXPECT_EQ(log.text(), "");
}

TEST_F(ConnectionFailure, IsNotTriedAgain)
{
    set_connection_attempts(5);
    calls.perform = [](size_t) { return CURLE_COULDNT_CONNECT; };

    open_connection(upload_url, 1, 0);

    EXPECT_EQ(calls.performances, 1u);
}

TEST_F(ConnectionFailure, OfTheSocketDropsTheHandle)
{
    calls.refused_info = CURLINFO_LASTSOCKET;

    EXPECT_EQ(open_connection(upload_url, 0, 0).result, -2);

    EXPECT_EQ(calls.cleanups, 0u);
    EXPECT_EQ(output.text(), "");
    ASSERT_EQ(calls.handles.size(), 1u);
    curl_easy_cleanup(calls.handles[0]);
}

class ConnectionClock : public ConnectionOptions {
protected:
    socket_calls socket;
};

TEST_F(ConnectionClock, IsReadWhenTheConnectionStands)
{
    socket.clock = 1'700'000'000;

    opened result = open_connection(upload_url, 0, 0);

    ASSERT_EQ(result.result, 0);
    EXPECT_EQ(result.connection->last_transmission, 1'700'000'000);
}

TEST_F(ConnectionClock, LeavesTheTimeUnsetIfItCannotBeRead)
{
    socket.clock = -1;

    opened result = open_connection(upload_url, 0, 0);

    ASSERT_EQ(result.result, 0);
    EXPECT_EQ(result.connection->last_transmission, 0);
}

// Wherever port 443 may not be bound, TLS is tested on another.
class TlsOnAnotherPort : public library_test {
protected:
    TlsOnAnotherPort() { calls.other_port = server.port(); }

    std::string url() const { return "https://127.0.0.1/a/path"; }

    easy_calls calls;
    stdout_capture output;
};

TEST_F(TlsOnAnotherPort, CarriesARequestAndItsReply)
{
    const std::string body(1024 * 1024, 'r');
    server.answer(http_reply(200, body));
    opened result = open_connection(url().c_str(), 1, 10);
    ASSERT_EQ(result.result, 0);

    EXPECT_EQ(write_all(result.connection.get(), "GET /a HTTP/1.1\r\n\r\n"), "");
    whole_reply reply = read_all(result.connection.get());

    EXPECT_EQ(reply.last_result, 0);
    EXPECT_EQ(reply.bytes, http_reply(200, body));
}

TEST_F(TlsOnAnotherPort, IsRefusedWithACertificateOfAnUnknownRoot)
{
    scripted_server stranger{tls_with(certificate_of_unknown_root())};
    calls.other_port = stranger.port();

    EXPECT_EQ(open_connection(url().c_str(), 1, 10).result, -1);

    EXPECT_EQ(output.text(), std::string("Curl error: ") +
                                 curl_easy_strerror(CURLE_PEER_FAILED_VERIFICATION) + "\n");
    EXPECT_TRUE(stranger.wait_for_handshake_failures(1));
}

} // namespace
} // namespace quillmere_test
