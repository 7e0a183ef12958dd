// Where an exchange lets itself be led, and where not.
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

std::string redirect_to(const std::string &location, int status = 302)
{
    return http_reply(status, "moved", {"Location: " + location});
}

class Redirect : public library_test {
protected:
    std::string plain_url() const { return plain_server.base_url() + path; }
    std::string tls_url() const { return server.base_url() + path; }
};

// Leads from /hops/0 to /hops/1 and so on, and answers at the last.
std::string hop(const request &from, int last)
{
    int number = std::stoi(from.target.substr(std::string("/hops-of-the-test/").size()));
    if (number == last)
        return http_reply(200, "arrived");
    return redirect_to("/hops-of-the-test/" + std::to_string(number + 1));
}

TEST_F(Redirect, IsFollowedThirtyTimes)
{
    plain_server.answer_with([](const request &from) { return hop(from, 30); });

    exchange result = fetch(plain_server.base_url() + "/hops-of-the-test/0");

    EXPECT_EQ(result.code, 200);
    EXPECT_EQ(result.body, "arrived");
    EXPECT_EQ(plain_server.requests().size(), 31u);
}

TEST_F(Redirect, IsNotFollowedThirtyOneTimes)
{
    plain_server.answer_with([](const request &from) { return hop(from, 31); });

    exchange result = fetch(plain_server.base_url() + "/hops-of-the-test/0");

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(plain_server.requests().size(), 31u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_TOO_MANY_REDIRECTS)));
}

TEST_F(Redirect, LeavesNothingOfItsOwnBody)
{
    plain_server.next({answering(redirect_to("/elsewhere")), answering(http_reply(200, "here"))});

    EXPECT_EQ(fetch(plain_url()).body, "here");
    EXPECT_EQ(plain_server.requests().at(1).target, "/elsewhere");
}

TEST_F(Redirect, WithoutALocationIsAnAnswer)
{
    plain_server.answer(http_reply(301, "moved, but where to?"));

    exchange result = fetch(plain_url());

    EXPECT_EQ(result.code, 301);
    EXPECT_EQ(result.body, "moved, but where to?");
    EXPECT_EQ(plain_server.requests().size(), 1u);
}

TEST_F(Redirect, LeadsFromHttpToHttps)
{
    plain_server.answer(redirect_to(server.base_url() + "/encrypted"));
    server.answer(http_reply(200, "encrypted"));

    EXPECT_EQ(fetch(plain_url()).body, "encrypted");
    EXPECT_EQ(server.requests().at(0).target, "/encrypted");
}

TEST_F(Redirect, LeadsFromHttpsToHttps)
{
    scripted_server other{tls_with(loopback_certificate())};
    server.answer(redirect_to(other.base_url() + "/encrypted"));
    other.answer(http_reply(200, "encrypted"));

    EXPECT_EQ(fetch(tls_url()).body, "encrypted");
}

TEST_F(Redirect, NeverLeadsFromHttpsToHttp)
{
    server.answer(redirect_to(plain_server.base_url() + "/plain"));
    plain_server.answer(http_reply(200, "plain"));

    exchange result = fetch(tls_url());

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(plain_server.connections(), 0u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_UNSUPPORTED_PROTOCOL)));
}

TEST_F(Redirect, NeverLeadsFromHttpOverHttpsBackToHttp)
{
    plain_server.next({answering(redirect_to(server.base_url() + "/encrypted")),
                       answering(http_reply(200, "plain"))});
    server.answer(redirect_to(plain_server.base_url() + "/plain"));

    EXPECT_EQ(fetch(plain_url()).code, -1);
    EXPECT_EQ(plain_server.connections(), 1u);
    EXPECT_EQ(server.connections(), 1u);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_UNSUPPORTED_PROTOCOL)));
}

TEST_F(Redirect, NeverLeadsToHttpOverAConnectionThatIsUsedAgain)
{
    server.script([this](connection &client) {
        client.read_request();
        client.send("HTTP/1.1 302 Found\r\nLocation: /again\r\nContent-Length: 0\r\n\r\n");
        client.read_request();
        client.send(redirect_to(plain_server.base_url() + "/plain"));
        client.close();
    });

    EXPECT_EQ(fetch(tls_url()).code, -1);
    EXPECT_EQ(server.requests().size(), 2u);
    EXPECT_EQ(plain_server.connections(), 0u);
}

TEST_F(Redirect, OfOneAttemptDoesNotBindTheNext)
{
    set_connection_attempts(2);
    plain_server.next({answering(redirect_to(server.base_url() + "/encrypted")),
                       answering(redirect_to(plain_server.base_url() + "/other")),
                       answering(http_reply(200, "plain"))});
    server.script(resetting());

    EXPECT_EQ(fetch(plain_url()).body, "plain");
}

TEST_F(Redirect, KeepsItsSchemeForALocationWithoutOne)
{
    scripted_server other{tls_with(loopback_certificate())};
    server.answer(redirect_to("//127.0.0.1:" + std::to_string(other.port()) + "/encrypted"));
    other.answer(http_reply(200, "encrypted"));

    EXPECT_EQ(fetch(tls_url()).body, "encrypted");
}

TEST_F(Redirect, ChecksTheCertificateOfWhereItLeads)
{
    scripted_server impostor{tls_with(certificate_of_unknown_root())};
    server.answer(redirect_to(impostor.base_url() + "/encrypted"));

    EXPECT_EQ(fetch(tls_url()).code, -1);
    EXPECT_EQ(impostor.requests().size(), 0u);
}

class RedirectToAnotherScheme : public Redirect,
                                public testing::WithParamInterface<const char *> {};

TEST_P(RedirectToAnotherScheme, IsRefusedFromHttp)
{
    plain_server.answer(redirect_to(GetParam()));

    exchange result = fetch(plain_url());

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_UNSUPPORTED_PROTOCOL)));
}

TEST_P(RedirectToAnotherScheme, IsRefusedFromHttps)
{
    server.answer(redirect_to(GetParam()));

    EXPECT_EQ(fetch(tls_url()).code, -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_UNSUPPORTED_PROTOCOL)));
}

INSTANTIATE_TEST_SUITE_P(Schemes, RedirectToAnotherScheme,
                         testing::Values("file:///etc/hostname", "ftp://127.0.0.1:1/file",
                                         "ftps://127.0.0.1:1/file", "gopher://127.0.0.1:1/file",
                                         "dict://127.0.0.1:1/d:word", "ldap://127.0.0.1:1/",
                                         "smb://127.0.0.1/share/file"));

class RedirectedPost : public Redirect,
                       public testing::WithParamInterface<std::pair<int, const char *>> {};

TEST_P(RedirectedPost, GoesOnAsItsStatusDemands)
{
    auto [status, method] = GetParam();
    plain_server.next(
        {answering(redirect_to("/elsewhere", status)), answering(http_reply(200, "taken"))});

    EXPECT_EQ(fetch(plain_url(), post_of("the body")).body, "taken");

    ASSERT_EQ(plain_server.requests().size(), 2u);
    EXPECT_EQ(plain_server.requests()[0].method, "POST");
    EXPECT_EQ(plain_server.requests()[1].method, method);
    EXPECT_EQ(plain_server.requests()[1].body, std::string(method) == "POST" ? "the body" : "");
}

INSTANTIATE_TEST_SUITE_P(Statuses, RedirectedPost,
                         testing::Values(std::make_pair(301, "GET"), std::make_pair(302, "GET"),
                                         std::make_pair(303, "GET"), std::make_pair(307, "POST"),
                                         std::make_pair(308, "POST")));

} // namespace
} // namespace quillmere_test
