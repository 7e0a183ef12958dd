// What is asked and what is answered, as long as the network does its part.
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

class HttpExchange : public library_test {
protected:
    // Long enough for any base address to be attempted.
    std::string url(const std::string &path = "/a/path/of/some/length") const
    {
        return plain_server.base_url() + path;
    }

    std::string url_of_length(size_t length) const
    {
        std::string text = plain_server.base_url() + "/";
        return text + std::string(length - text.size(), 'a');
    }
};

TEST_F(HttpExchange, RefusesAUrlOf26CharactersWithoutATransfer)
{
    exchange result = fetch(url_of_length(26));

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(result.length, 0u);
    EXPECT_EQ(plain_server.connections(), 0u);
    EXPECT_EQ(log.text(), "");
}

TEST_F(HttpExchange, AttemptsAUrlOf27Characters)
{
    plain_server.answer(http_reply(200, "here"));

    exchange result = fetch(url_of_length(27));

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "here");
}

TEST_F(HttpExchange, HoldsToItsShortestUrlWhateverTheBaseAddressesAre)
{
    urls[0] = urls[1] = "x:/";

    EXPECT_EQ(fetch("x:/short").code, -1);
    EXPECT_EQ(log.text(), "");
}

TEST_F(HttpExchange, HandsOutTheBodyWithItsLength)
{
    plain_server.answer(http_reply(200, "twelve bytes"));

    exchange result = fetch(url());

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "twelve bytes");
    EXPECT_EQ(result.length, 12u);
    EXPECT_EQ(log.text(), "");
}

TEST_F(HttpExchange, HandsOutBytesOfAnyKind)
{
    const std::string bytes("\0\xff<\0>\r\n\0", 8);
    plain_server.answer(http_reply(200, bytes));

    exchange result = fetch(url());

    EXPECT_EQ(result.body, bytes);
    EXPECT_EQ(result.length, 8u);
}

TEST_F(HttpExchange, HandsOutNothingForAnEmptyBody)
{
    plain_server.answer(http_reply(200, ""));

    exchange result = fetch(url());

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(result.length, 0u);
}

TEST_F(HttpExchange, JoinsABodyThatArrivesInPieces)
{
    const std::string body(5000, 'q');
    plain_server.script([&](connection &client) {
        client.read_request();
        client.send_in_pieces(http_reply(200, body), 7);
    });

    EXPECT_EQ(fetch(url()).body, body);
}

TEST_F(HttpExchange, ReadsAChunkedBody)
{
    plain_server.answer("HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\nConnection: close\r\n\r\n"
                        "4\r\nfour\r\n3\r\nsix\r\n0\r\n\r\n");

    EXPECT_EQ(fetch(url()).body, "foursix");
}

TEST_F(HttpExchange, ReadsABodyThatEndsWithTheConnection)
{
    plain_server.answer("HTTP/1.1 200 OK\r\n\r\nuntil the end");

    EXPECT_EQ(fetch(url()).body, "until the end");
}

TEST_F(HttpExchange, ReadsABodyOf50Megabytes)
{
    std::string body(50 * 1000 * 1000, 'b');
    body.replace(0, 5, "start");
    body.replace(body.size() - 3, 3, "end");
    plain_server.answer(http_reply(200, body));

    exchange result = fetch(url());

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.length, body.size());
    EXPECT_TRUE(result.body == body);
}

TEST_F(HttpExchange, SendsTheTargetAsItStands)
{
    plain_server.answer(http_reply(200, "here"));

    fetch(url("/path/%41b.php?one=a%20b&two=(x)*!^&three=a+b"));

    ASSERT_EQ(plain_server.requests().size(), 1u);
    request sent = plain_server.requests()[0];
    EXPECT_EQ(sent.method, "GET");
    EXPECT_EQ(sent.target, "/path/%41b.php?one=a%20b&two=(x)*!^&three=a+b");
    EXPECT_EQ(sent.version, "HTTP/1.1");
    EXPECT_EQ(sent.body, "");
}

TEST_F(HttpExchange, PostsABodyThatHasALength)
{
    plain_server.answer(http_reply(200, "taken"));
    const std::string body("with a \0 inside", 15);

    exchange result = fetch(url(), post_of(body));

    EXPECT_EQ(result.body, "taken");
    ASSERT_EQ(plain_server.requests().size(), 1u);
    request sent = plain_server.requests()[0];
    EXPECT_EQ(sent.method, "POST");
    EXPECT_EQ(sent.target, "/a/path/of/some/length");
    EXPECT_EQ(sent.header("Content-Length"), "15");
    EXPECT_EQ(sent.body, body);
}

TEST_F(HttpExchange, PostsNoMoreOfTheBodyThanItsLength)
{
    plain_server.answer(http_reply(200, "taken"));

    fetch(url(), {"only these, not those", 10});

    EXPECT_EQ(plain_server.requests().at(0).body, "only these");
}

TEST_F(HttpExchange, PostsABodyOfMegabytes)
{
    plain_server.answer(http_reply(200, "taken"));
    const std::string body(3 * 1024 * 1024, 'm');

    EXPECT_EQ(fetch(url(), post_of(body)).code, 200);
    EXPECT_TRUE(plain_server.requests().at(0).body == body);
}

TEST_F(HttpExchange, SendsABodyOfLengthZeroAsAGet)
{
    plain_server.answer(http_reply(200, "here"));

    fetch(url(), {"body", 0});

    EXPECT_EQ(plain_server.requests().at(0).method, "GET");
}

TEST_F(HttpExchange, SendsALengthWithoutABodyAsAGet)
{
    plain_server.answer(http_reply(200, "here"));

    fetch(url(), {nullptr, 4});

    EXPECT_EQ(plain_server.requests().at(0).method, "GET");
    EXPECT_EQ(plain_server.requests().at(0).header("Content-Length"), std::nullopt);
}

TEST_F(HttpExchange, TakesNoNoticeOfTheTestHarnessPointer)
{
    int harness = 0;
    debug_replace_get_response_from_url = &harness;
    plain_server.answer(http_reply(200, "here"));

    EXPECT_EQ(fetch(url()).body, "here");
    EXPECT_EQ(debug_replace_get_response_from_url, &harness);
}

TEST_F(HttpExchange, ReadsAFileWhenTheFirstRequestNamesOne)
{
    temporary_folder folder;
    std::string path = folder.write("a-file-of-the-test-itself", "from the disk");

    exchange result = fetch("file://" + path);

    EXPECT_EQ(result.code, 0);
    EXPECT_EQ(result.body, "from the disk");
}

TEST_F(HttpExchange, FailsForAFileThatIsNotThere)
{
    temporary_folder folder;

    EXPECT_EQ(fetch("file://" + folder.path_of("no-such-file-is-there")).code, -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_FILE_COULDNT_READ_FILE)));
}

// A status is the caller's to judge, so every one comes back, and none is tried again.
class HttpStatus : public HttpExchange, public testing::WithParamInterface<int> {};

TEST_P(HttpStatus, ComesBackWithItsBody)
{
    set_connection_attempts(3);
    plain_server.answer(http_reply(GetParam(), "its body"));

    exchange result = fetch(url());

    EXPECT_EQ(result.code, GetParam());
    EXPECT_EQ(result.body, "its body");
    EXPECT_EQ(result.length, 8u);
    EXPECT_EQ(plain_server.connections(), 1u);
    EXPECT_EQ(log.text(), "");
}

TEST_P(HttpStatus, ComesBackWithoutABody)
{
    set_connection_attempts(3);
    plain_server.answer(http_reply(GetParam(), ""));

    exchange result = fetch(url());

    EXPECT_EQ(result.code, GetParam());
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(result.length, 0u);
    EXPECT_EQ(plain_server.connections(), 1u);
}

INSTANTIATE_TEST_SUITE_P(Codes, HttpStatus,
                         testing::Values(200, 201, 299, 301, 302, 399, 400, 403, 404, 418, 500, 502,
                                         503, 599),
                         testing::PrintToStringParamName());

TEST_F(HttpExchange, ReturnsStatus204WithoutABody)
{
    plain_server.answer(http_reply(204, ""));

    exchange result = fetch(url());

    EXPECT_EQ(result.code, 204);
    EXPECT_EQ(result.body, std::nullopt);
}

TEST(CurlWriteFunction, AppendsAllBytesAndReturnsTheirNumber)
{
    string_buffer *buffer = string_new(0);
    char data[] = {'a', '\0', 'b', 'c', 'd', 'e'};

    EXPECT_EQ(curl_write_function(data, 2, 3, buffer), 6u);
    EXPECT_EQ(curl_write_function(data, 1, 1, buffer), 1u);

    EXPECT_EQ(std::string(string_get(buffer), string_get_size(buffer)), std::string("a\0bcdea", 7));
    string_delete(buffer, 1);
}

TEST(CurlWriteFunction, TakesNothingAsNothing)
{
    string_buffer *buffer = string_new(0);
    char data[] = "unused";

    EXPECT_EQ(curl_write_function(data, 1, 0, buffer), 0u);

    EXPECT_EQ(string_get_size(buffer), 0u);
    EXPECT_STREQ(string_get(buffer), "");
    string_delete(buffer, 1);
}

} // namespace
} // namespace quillmere_test
