// A ceiling for the bodies that are taken, which an application may ask for.
#include "support/library_fixture.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

const std::string too_long = literally("Response is longer than the limit of 10 bytes.\n");

class ResponseLimit : public library_test {
protected:
    std::string url() const { return plain_server.base_url() + "/a/path/of/some/length"; }
};

TEST_F(ResponseLimit, IsNoneAtFirst)
{
    const std::string body(1 << 20, 'a');
    plain_server.answer(http_reply(200, body));

    EXPECT_EQ(fetch(url()).body, body);
}

TEST_F(ResponseLimit, TakesABodyOfExactlyThatLength)
{
    plain_server.answer(http_reply(200, "ten bytes."));
    EXPECT_EQ(set_response_limit(10), 0);

    const exchange result = fetch(url());

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "ten bytes.");
    EXPECT_EQ(log.text(), "");
}

TEST_F(ResponseLimit, FailsTheAttemptPastIt)
{
    plain_server.answer(http_reply(200, "ten bytes.."));
    set_response_limit(10);

    const exchange result = fetch(url());

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(result.length, 0u);
    EXPECT_THAT(log.text(), MatchesRegex(too_long + failure_line(CURLE_WRITE_ERROR)));
}

TEST_F(ResponseLimit, CountsWhatArrivesInPiecesWithoutAnAnnouncedLength)
{
    plain_server.script([](connection &client) {
        client.read_request();
        client.send_in_pieces("HTTP/1.1 200 OK\r\n\r\nelevenbytes", 1);
    });
    set_response_limit(10);

    EXPECT_EQ(fetch(url()).code, -1);
    EXPECT_THAT(log.text(), MatchesRegex(too_long + failure_line(CURLE_WRITE_ERROR)));
}

TEST_F(ResponseLimit, EndsABodyThatNeverWould)
{
    plain_server.script([](connection &client) {
        client.read_request();
        client.send("HTTP/1.1 200 OK\r\n\r\n");
        client.send_until_closed(std::string(1000, 'a'), std::chrono::milliseconds(0));
    });
    set_response_limit(10);

    EXPECT_EQ(fetch(url()).code, -1);
    EXPECT_TRUE(plain_server.wait_until_idle());
}

TEST_F(ResponseLimit, IsTriedAgainAsEveryFailureIs)
{
    plain_server.next(
        {answering(http_reply(200, "ten bytes..")), answering(http_reply(200, "ok"))});
    set_response_limit(10);
    set_connection_attempts(2);

    const exchange result = fetch(url());

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "ok");
    EXPECT_EQ(plain_server.requests().size(), 2u);
}

TEST_F(ResponseLimit, CountsNoBodyThatIsOnlyOnTheWayToAnother)
{
    const std::string detour = "HTTP/1.1 302 Found\r\nLocation: /there/and/a/bit/further\r\n"
                               "Content-Length: 20\r\n\r\n" +
                               std::string(20, 'a');
    plain_server.next({answering(detour), answering(http_reply(200, "there"))});
    set_response_limit(10);

    EXPECT_EQ(fetch(url()).body, "there");
}

TEST_F(ResponseLimit, MakesAnOperationFailForWantOfAResponse)
{
    server.answer(xml_reply("<response><result>Success</result></response>"));
    set_response_limit(10);
    system_status *status = nullptr;
    char *message = nullptr;

    EXPECT_EQ(get_system_status(&status, &message), QM_NO_RESPONSE);

    EXPECT_STREQ(message, no_code);
    EXPECT_EQ(status, nullptr);
    api_free(message);
}

TEST_F(ResponseLimit, HoldsForAProbeOfAUrl)
{
    plain_server.answer(http_reply(200, "ten bytes.."));
    set_response_limit(10);

    EXPECT_EQ(check_url_response(plain_server.base_url().c_str(), "q", "ten bytes..", 5000), 0);
    EXPECT_THAT(log.text(),
                MatchesRegex(too_long + failure_line(CURLE_WRITE_ERROR) +
                             literally("Response does not match because -1 does not match 200!")));
}

TEST_F(ResponseLimit, IsTakenBackByZero)
{
    plain_server.answer(http_reply(200, "ten bytes.."));
    set_response_limit(10);
    EXPECT_EQ(set_response_limit(0), 0);

    EXPECT_EQ(fetch(url()).body, "ten bytes..");
}

TEST_F(ResponseLimit, RefusesANegativeValueAndStays)
{
    plain_server.answer(http_reply(200, "ten bytes.."));
    set_response_limit(10);

    EXPECT_EQ(set_response_limit(-1), 1);

    EXPECT_EQ(log.text(), "set_response_limit error: limit must not be negative\n");
    EXPECT_EQ(fetch(url()).code, -1);
}

} // namespace
} // namespace quillmere_test
