// The two probes: which answers they accept, and what they log about the others.
#include "support/library_fixture.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

constexpr int32_t five_seconds = 5000;

std::string too_long_for_libcurl()
{
    return "http://127.0.0.1/" + std::string(8 * 1000 * 1000, 'a');
}

class StatusProbe : public library_test {
protected:
    std::string url(const std::string &path = "/probe") const
    {
        return plain_server.base_url() + path;
    }
    int32_t probe(const std::string &address) const
    {
        return check_url_response_code(address.c_str(), five_seconds);
    }
};

class AcceptedStatus : public StatusProbe, public testing::WithParamInterface<int> {};

TEST_P(AcceptedStatus, GivesOneAndNoLog)
{
    plain_server.answer(http_reply(GetParam(), ""));

    EXPECT_EQ(probe(url()), 1);
    EXPECT_EQ(log.text(), "");
}

INSTANTIATE_TEST_SUITE_P(Codes, AcceptedStatus, testing::Values(200, 201, 204, 302, 304, 399));

class UnacceptedStatus : public StatusProbe, public testing::WithParamInterface<int> {};

TEST_P(UnacceptedStatus, GivesZeroAndIsLogged)
{
    plain_server.answer(http_reply(GetParam(), ""));

    EXPECT_EQ(probe(url()), 0);
    EXPECT_EQ(log.text(), "Response does not match: " + std::to_string(GetParam()) + "\n");
}

INSTANTIATE_TEST_SUITE_P(Codes, UnacceptedStatus, testing::Values(400, 404, 500, 599));

TEST_F(StatusProbe, AsksForNoBody)
{
    plain_server.answer(http_reply(200, ""));

    EXPECT_EQ(probe(url("/probe?a=b")), 1);

    EXPECT_EQ(plain_server.requests().at(0).method, "HEAD");
    EXPECT_EQ(plain_server.requests().at(0).target, "/probe?a=b");
}

TEST_F(StatusProbe, TakesAUrlOfAnyLength)
{
    plain_server.answer(http_reply(200, ""));
    std::string shortest = plain_server.base_url();
    ASSERT_LT(shortest.size(), 27u);

    EXPECT_EQ(probe(shortest), 1);
}

TEST_F(StatusProbe, FollowsRedirects)
{
    plain_server.next(
        {answering(http_reply(302, "", {"Location: /elsewhere"})), answering(http_reply(404, ""))});

    EXPECT_EQ(probe(url()), 0);

    EXPECT_EQ(plain_server.requests().at(1).method, "HEAD");
    EXPECT_EQ(plain_server.requests().at(1).target, "/elsewhere");
    EXPECT_EQ(log.text(), "Response does not match: 404\n");
}

TEST_F(StatusProbe, FollowsNoRedirectFromHttpsToHttp)
{
    server.answer(http_reply(302, "", {"Location: " + url()}));
    plain_server.answer(http_reply(200, ""));

    EXPECT_EQ(probe(server.base_url() + "/probe"), 0);
    EXPECT_EQ(plain_server.connections(), 0u);
}

TEST_F(StatusProbe, TriesOnceAndLogsTheFailure)
{
    set_connection_attempts(3);
    plain_server.script(closing());

    EXPECT_EQ(probe(url()), 0);

    EXPECT_EQ(plain_server.connections(), 1u);
    EXPECT_THAT(log.text(),
                MatchesRegex(failure_line(CURLE_GOT_NOTHING) + "Response does not match: -1\n"));
}

TEST_F(StatusProbe, LogsARefusedConnection)
{
    refused_port refused;

    EXPECT_EQ(probe(refused.base_url() + "/probe"), 0);

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_COULDNT_CONNECT) +
                                         "Response does not match: -1\n"));
}

TEST_F(StatusProbe, TriesNothingWithAUrlThatLibcurlRefuses)
{
    EXPECT_EQ(probe(too_long_for_libcurl()), 0);
    EXPECT_EQ(log.text(), "cUrl setopt failed.\nResponse does not match: -1\n");
}

TEST_F(StatusProbe, RoundsAMillisecondUpToASecond)
{
    plain_server.script(stalling());

    EXPECT_EQ(check_url_response_code(url().c_str(), 1), 0);

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_OPERATION_TIMEDOUT) +
                                         "Response does not match: -1\n"));
}

TEST_F(StatusProbe, VerifiesThePeer)
{
    server.answer(http_reply(200, ""));
    EXPECT_EQ(probe(server.base_url() + "/probe"), 1);
    scripted_server impostor{tls_with(certificate_of_unknown_root())};

    EXPECT_EQ(probe(impostor.base_url() + "/probe"), 0);
    EXPECT_EQ(impostor.requests().size(), 0u);
}

TEST_F(StatusProbe, VerifiesThePeerThoughOperationsDoNot)
{
    ssl_disabled = 1;
    scripted_server impostor{tls_with(certificate_of_unknown_root())};
    impostor.answer(http_reply(200, ""));

    EXPECT_EQ(probe(impostor.base_url() + "/probe"), 0);
}

TEST_F(StatusProbe, VerifiesTheHostNameAloneWithoutCertificates)
{
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);
    scripted_server unknown{tls_with(certificate_of_unknown_root())};
    scripted_server other{tls_with(certificate_for_another_host())};
    unknown.answer(http_reply(200, ""));
    other.answer(http_reply(200, ""));

    EXPECT_EQ(probe(unknown.base_url() + "/probe"), 1);
    EXPECT_EQ(probe(other.base_url() + "/probe"), 0);
}

class BodyProbe : public library_test {
protected:
    int32_t probe(const char *query, const std::string &expected) const
    {
        std::string base = plain_server.base_url() + "/probe";
        return check_url_response(base.c_str(), query, expected.c_str(), five_seconds);
    }
};

TEST_F(BodyProbe, AcceptsTheExpectedBody)
{
    plain_server.answer(http_reply(200, "expected"));

    EXPECT_EQ(probe("q", "expected"), 1);
    EXPECT_EQ(log.text(), "");
}

TEST_F(BodyProbe, EncodesTheQueryAsAWhole)
{
    plain_server.answer(http_reply(200, "expected"));

    probe("a=1&b=(x y)*!^", "expected");

    EXPECT_EQ(plain_server.requests().at(0).method, "GET");
    EXPECT_EQ(plain_server.requests().at(0).target, "/probe?a%3d1%26b%3d(x%20y)*!^");
}

TEST_F(BodyProbe, SendsAnEmptyQueryToo)
{
    plain_server.answer(http_reply(200, "expected"));

    EXPECT_EQ(probe("", "expected"), 1);
    EXPECT_EQ(plain_server.requests().at(0).target, "/probe?");
}

TEST_F(BodyProbe, AcceptsAnEmptyBodyWhereNoneIsExpected)
{
    plain_server.answer(http_reply(200, ""));

    EXPECT_EQ(probe("q", ""), 1);
    EXPECT_EQ(log.text(), "");
}

struct mismatch {
    const char *received;
    const char *expected;
};

void PrintTo(const mismatch &each, std::ostream *out)
{
    *out << '"' << each.received << "\" for \"" << each.expected << '"';
}

class MismatchedBody : public BodyProbe, public testing::WithParamInterface<mismatch> {};

TEST_P(MismatchedBody, IsLoggedBesideTheExpectedOne)
{
    auto [received, expected] = GetParam();
    plain_server.answer(http_reply(200, received));

    EXPECT_EQ(probe("q", expected), 0);
    EXPECT_EQ(log.text(),
              std::string("Response:\n") + received + "\nDoes not match:\n" + expected + "\n");
}

INSTANTIATE_TEST_SUITE_P(Bodies, MismatchedBody,
                         testing::Values(mismatch{"received", "expected"},
                                         mismatch{"expected and more", "expected"},
                                         mismatch{"expect", "expected"},
                                         mismatch{"Expected", "expected"}, mismatch{"", "expected"},
                                         mismatch{"received", ""}));

TEST_F(BodyProbe, ComparesBeyondANulByte)
{
    plain_server.answer(http_reply(200, std::string("expected\0more", 13)));

    EXPECT_EQ(probe("q", "expected"), 0);
    EXPECT_EQ(log.text(), "Response:\nexpected\nDoes not match:\nexpected\n");
}

class OtherThan200 : public BodyProbe, public testing::WithParamInterface<int> {};

TEST_P(OtherThan200, IsLoggedWithoutALineEnd)
{
    plain_server.answer(http_reply(GetParam(), "expected"));

    EXPECT_EQ(probe("q", "expected"), 0);
    EXPECT_EQ(log.text(), "Response does not match because " + std::to_string(GetParam()) +
                              " does not match 200!");
}

INSTANTIATE_TEST_SUITE_P(Codes, OtherThan200, testing::Values(201, 302, 399, 404, 500));

TEST_F(BodyProbe, FollowsRedirects)
{
    plain_server.next({answering(http_reply(302, "moved", {"Location: /elsewhere"})),
                       answering(http_reply(200, "expected"))});

    EXPECT_EQ(probe("q", "expected"), 1);
}

TEST_F(BodyProbe, TriesOnceAndLogsTheFailure)
{
    set_connection_attempts(3);
    plain_server.answer("HTTP/1.1 200 OK\r\nContent-Length: 100\r\n\r\nexpected");

    EXPECT_EQ(probe("q", "expected"), 0);

    EXPECT_EQ(plain_server.connections(), 1u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_PARTIAL_FILE) +
                                         "Response does not match because -1 does not match 200!"));
}

TEST_F(BodyProbe, TriesNothingWithAUrlThatLibcurlRefuses)
{
    EXPECT_EQ(check_url_response(too_long_for_libcurl().c_str(), "q", "expected", five_seconds), 0);
    EXPECT_EQ(log.text(),
              "cUrl setopt failed.\nResponse does not match because -1 does not match 200!");
}

TEST_F(BodyProbe, RoundsAMillisecondUpToASecond)
{
    plain_server.script(stalling());

    EXPECT_EQ(check_url_response((plain_server.base_url() + "/probe").c_str(), "q", "expected", 1),
              0);

    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_OPERATION_TIMEDOUT) +
                                         "Response does not match because -1 does not match 200!"));
}

TEST_F(BodyProbe, VerifiesThePeerThoughOperationsDoNot)
{
    ssl_disabled = 1;
    scripted_server impostor{tls_with(certificate_of_unknown_root())};
    impostor.answer(http_reply(200, "expected"));

    EXPECT_EQ(
        check_url_response((impostor.base_url() + "/probe").c_str(), "q", "expected", five_seconds),
        0);
}

} // namespace
} // namespace quillmere_test
