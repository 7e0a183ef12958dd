// Session tokens: what is signed, sent, shown and handed out.
#include <gtest/gtest.h>

#include "api/operations.h"
#include "support/library_fixture.h"

namespace quillmere_test {
namespace {

struct credentials {
    const char *what;
    const char *email;
    const char *password;
    const char *facebook;
    const char *application_id;
    const char *application_key;
    const char *query;
    const char *logged_query;
};

void PrintTo(const credentials &each, std::ostream *out) { *out << each.what; }

constexpr const char *token_reply =
    "<response><result>Success</result><session_token>token</session_token></response>";

class SessionTokenRequest : public library_test, public testing::WithParamInterface<credentials> {};

TEST_P(SessionTokenRequest, IsSignedAndHidesItsSecretsInTheLog)
{
    const credentials &given = GetParam();
    server.answer(xml_reply(token_reply));
    char *token = nullptr;

    EXPECT_EQ(get_session_token(given.email, given.password, given.facebook, given.application_id,
                                given.application_key, &token),
              0);

    EXPECT_EQ(taken(token), "token");
    EXPECT_EQ(server.requests().at(0).target,
              std::string("/api/user/get_session_token.php") + given.query);
    EXPECT_EQ(log.text(), "Session token url:\n" + server.base_url() +
                              "/api/user/get_session_token.php" + given.logged_query +
                              "\nGot text:\n" + token_reply + "\nText len: 81\n");
}

constexpr const char *facebook_query =
    "?application_id=42&fb_access_token=fb%20token%2b"
    "&signature=af8472ef7bb624e84521e6e61c8c82fd344678d2&version=2";
constexpr const char *facebook_log =
    "?application_id=42&fb_access_token=(omitted)&signature=(omitted)&version=2";
constexpr const char *password_query =
    "?application_id=42&email=user%40example%2ecom&password=pa%26ss%20w%2frd%25"
    "&signature=c3182a3d5fc409b124806fb498ea97318c374845&version=2";
constexpr const char *password_log = "?application_id=42&email=user%40example%2ecom"
                                     "&password=(omitted)&signature=(omitted)&version=2";
constexpr const char *bare_query =
    "?application_id=42&signature=8e0b9a70f0ee010cf40f269127a47b6ae4614714&version=2";
constexpr const char *bare_log = "?application_id=42&signature=(omitted)&version=2";
constexpr const char *key = "key of the application";
constexpr const char *email = "user@example.com";
constexpr const char *password = "pa&ss w/rd%";

INSTANTIATE_TEST_SUITE_P(
    Credentials, SessionTokenRequest,
    testing::Values(
        credentials{"a password", email, password, nullptr, "42", key, password_query,
                    password_log},
        credentials{"a password and an empty token", email, password, "", "42", key, password_query,
                    password_log},
        credentials{"a password goes before a token", email, password, "fb token+", "42", key,
                    password_query, password_log},
        credentials{"a token", nullptr, nullptr, "fb token+", "42", key, facebook_query,
                    facebook_log},
        credentials{"a token and an empty password", email, "", "fb token+", "42", key,
                    facebook_query, facebook_log},
        credentials{"a token and no password", email, nullptr, "fb token+", "42", key,
                    facebook_query, facebook_log},
        credentials{"a token and an empty address", "", password, "fb token+", "42", key,
                    facebook_query, facebook_log},
        credentials{"a token and no address", nullptr, password, "fb token+", "42", key,
                    facebook_query, facebook_log},
        credentials{"nothing", nullptr, nullptr, nullptr, "42", key, bare_query, bare_log},
        credentials{"nothing but empty texts", "", "", "", "42", key, bare_query, bare_log},
        credentials{"an address alone", email, nullptr, nullptr, "42", key, bare_query, bare_log},
        credentials{"an application id that needs encoding", nullptr, nullptr, nullptr, "4 2key of",
                    " the application",
                    "?application_id=4%202key%20of"
                    "&signature=3f689179dadbfcb66950918d06766d6400aa7842&version=2",
                    "?application_id=4%202key%20of&signature=(omitted)&version=2"},
        credentials{"no application key", nullptr, nullptr, nullptr, "42", nullptr,
                    "?application_id=42&signature=92cfceb39d57d914ed8b14d0e37643de0797ae56"
                    "&version=2",
                    bare_log}));

class SessionToken : public library_test {
protected:
    int32_t get(char **token)
    {
        return get_session_token(email, password, nullptr, "42", key, token);
    }
};

TEST_F(SessionToken, IsMissedInASuccessWithoutOne)
{
    server.answer(xml_reply("<response><result>Success</result></response>"));
    char *token = nullptr;

    EXPECT_EQ(get(&token), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(token, nullptr);
}

TEST_F(SessionToken, StaysThoughTheReplyIsDamagedBehindIt)
{
    server.answer(xml_reply("<response><result>Success</result>"
                            "<session_token>token</session_token>"));
    char *token = nullptr;

    EXPECT_EQ(get(&token), QM_MALFORMED_REPLY);

    EXPECT_EQ(taken(token), "token");
}

TEST_F(SessionToken, IsHandedOutWithoutAMessage)
{
    hook_recorder hook;
    server.answer(xml_reply("<response><message>no error</message><result>Success</result>"
                            "<session_token>a&amp;b</session_token></response>"));
    char *token = nullptr;

    EXPECT_EQ(get(&token), 0);

    EXPECT_EQ(taken(token), "a&b");
    EXPECT_TRUE(hook.calls().empty());
}

TEST_F(SessionToken, OfARefusalIsItsMessage)
{
    server.answer(xml_reply("<response><session_token>no</session_token><result>Error</result>"
                            "<error>107</error><message>Wrong</message></response>"));
    char *token = nullptr;

    EXPECT_EQ(get(&token), 107);

    EXPECT_EQ(taken(token), "Wrong");
}

TEST_F(SessionToken, NeverShowsTheKeyOrThePasswordToAnyone)
{
    server.answer(xml_reply(token_reply));
    char *token = nullptr;

    get(&token);

    EXPECT_EQ(server.requests().at(0).head.find("key of"), std::string::npos);
    EXPECT_EQ(server.requests().at(0).head.find("key%20of"), std::string::npos);
    EXPECT_EQ(log.text().find("pa%26ss"), std::string::npos);
    EXPECT_EQ(log.text().find("pa&ss"), std::string::npos);
    EXPECT_EQ(log.text().find("c3182a3d"), std::string::npos);
    api_free(token);
}

class RenewedToken : public library_test {};

TEST_F(RenewedToken, IsHandedOut)
{
    server.answer(xml_reply(token_reply));
    char *token = nullptr;

    EXPECT_EQ(renew_session_token("old&token%", &token), 0);

    EXPECT_EQ(taken(token), "token");
    EXPECT_EQ(server.requests().at(0).target,
              "/api/user/renew_session_token.php?session_token=old&token%&version=2");
    EXPECT_EQ(log.text(), std::string("Got text:\n") + token_reply + "\nText len: 81\n");
}

TEST_F(RenewedToken, IsMissedInASuccessWithoutOne)
{
    server.answer(xml_reply("<response><result>Success</result></response>"));
    char *token = nullptr;

    EXPECT_EQ(renew_session_token("old", &token), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(token, nullptr);
}

TEST_F(RenewedToken, IsAskedForWithoutATokenToo)
{
    server.answer(xml_reply(token_reply));
    char *token = nullptr;

    EXPECT_EQ(renew_session_token(nullptr, &token), 0);

    EXPECT_EQ(server.requests().at(0).target,
              "/api/user/renew_session_token.php?session_token=&version=2");
    api_free(token);
}

TEST_F(RenewedToken, OfARefusalIsItsMessage)
{
    server.answer(xml_reply("<response><result>Error</result><error>105</error>"
                            "<message>Expired</message></response>"));
    char *token = nullptr;

    EXPECT_EQ(renew_session_token("old", &token), 105);

    EXPECT_EQ(taken(token), "Expired");
}

} // namespace
} // namespace quillmere_test
