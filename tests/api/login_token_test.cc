// Login tokens, and the rules for the pkey that comes with them.
#include <gtest/gtest.h>

#include "api/operations.h"
#include "support/library_fixture.h"

namespace quillmere_test {
namespace {

constexpr const char *login_key = "key of the application";

class LoginToken : public library_test {
protected:
    int32_t get()
    {
        return get_login_token(email, password, "42", login_key, pkey.place(), &token);
    }

    const char *email = "user@example.com";
    const char *password = "pa&ss w/rd%";
    pkey_slot pkey;
    char *token = nullptr;
};

TEST_F(LoginToken, IsHandedOutWithItsPkey)
{
    server.answer(xml_reply("<response><result>Success</result><pkey>the key</pkey>"
                            "<login_token>once</login_token></response>"));

    EXPECT_EQ(get(), 0);

    EXPECT_EQ(taken(token), "once");
    EXPECT_EQ(pkey.take(), "the key");
}

TEST_F(LoginToken, LogsTheUrlWithoutItsSecretsAndNoReply)
{
    server.answer(xml_reply("<response><result>Success</result><pkey>the key</pkey>"
                            "<login_token>once</login_token></response>"));

    get();

    EXPECT_EQ(log.text(), "get_login_token url:\n" + server.base_url() +
                              "/api/user/get_login_token.php?email=user%40example%2ecom"
                              "&password=(omitted)&application_id=42&signature=(omitted)"
                              "&version=2\n");
    api_free(token);
    pkey.take();
}

TEST_F(LoginToken, MayComeWithoutAPkey)
{
    server.answer(
        xml_reply("<response><result>Success</result><login_token>once</login_token></response>"));

    EXPECT_EQ(get(), 0);

    EXPECT_EQ(taken(token), "once");
    EXPECT_EQ(pkey.take(), std::nullopt);
}

TEST_F(LoginToken, IsMissedInASuccessWithoutOne)
{
    server.answer(xml_reply("<response><result>Success</result><pkey>the key</pkey></response>"));

    EXPECT_EQ(get(), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(token, nullptr);
    EXPECT_EQ(pkey.take(), "the key");
}

TEST_F(LoginToken, OfARefusalIsItsMessageAndThePkeyIsHandedOut)
{
    server.answer(xml_reply("<response><result>Error</result><pkey>the key</pkey>"
                            "<error>107</error><message>Wrong</message></response>"));

    EXPECT_EQ(get(), 107);

    EXPECT_EQ(taken(token), "Wrong");
    EXPECT_EQ(pkey.take(), "the key");
}

TEST_F(LoginToken, IsMissedInAReplyWithoutAResultAndThePkeyIsHandedOut)
{
    server.answer(http_reply(500, "<response><pkey>the key</pkey></response>"));

    EXPECT_EQ(get(), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(token, nullptr);
    EXPECT_EQ(pkey.take(), "the key");
}

TEST_F(LoginToken, EmptiesThePkeyThatAReplyLacks)
{
    char mine[] = "mine";
    *pkey.place() = mine;
    server.answer(xml_reply("<response><result>Error</result></response>"));

    EXPECT_EQ(get(), QM_UNUSABLE_ERROR_NUMBER);

    EXPECT_EQ(pkey.take(), std::nullopt);
    api_free(token);
}

TEST_F(LoginToken, LeavesThePkeyAloneWhenNoAnswerArrives)
{
    char mine[] = "mine";
    *pkey.place() = mine;
    server.script(resetting());

    EXPECT_EQ(get(), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(token, nullptr);
    EXPECT_EQ(*pkey.place(), mine);
    *pkey.place() = nullptr;
    pkey.take();
}

TEST_F(LoginToken, LeavesThePkeyAloneWhenAnEmptyReplyArrives)
{
    char mine[] = "mine";
    *pkey.place() = mine;
    server.answer(http_reply(200, ""));

    EXPECT_EQ(get(), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(*pkey.place(), mine);
    *pkey.place() = nullptr;
    pkey.take();
}

struct login_case {
    const char *what;
    const char *email;
    const char *password;
    const char *application_id;
    const char *application_key;
    const char *query;
};

void PrintTo(const login_case &each, std::ostream *out) { *out << each.what; }

class LoginTokenRequest : public LoginToken, public testing::WithParamInterface<login_case> {};

// All four pieces are always signed and all parameters sent, whether they are given or not.
TEST_P(LoginTokenRequest, IsSignedAsItStands)
{
    const login_case &given = GetParam();
    server.answer(xml_reply("<response><result>Error</result></response>"));

    get_login_token(given.email, given.password, given.application_id, given.application_key,
                    pkey.place(), &token);

    EXPECT_EQ(server.requests().at(0).target,
              std::string("/api/user/get_login_token.php") + given.query);
    api_free(token);
    pkey.take();
}

INSTANTIATE_TEST_SUITE_P(
    Credentials, LoginTokenRequest,
    testing::Values(login_case{"everything", "user@example.com", "pa&ss w/rd%", "42", login_key,
                               "?email=user%40example%2ecom&password=pa%26ss%20w%2frd%25"
                               "&application_id=42"
                               "&signature=c3182a3d5fc409b124806fb498ea97318c374845&version=2"},
                    login_case{"no password", "fb token", nullptr, "+42", login_key,
                               "?email=fb%20token&password=&application_id=%2b42"
                               "&signature=af8472ef7bb624e84521e6e61c8c82fd344678d2&version=2"},
                    login_case{"no address", "", "fb token+", "42", login_key,
                               "?email=&password=fb%20token%2b&application_id=42"
                               "&signature=af8472ef7bb624e84521e6e61c8c82fd344678d2&version=2"},
                    login_case{"an application alone", nullptr, nullptr, "42", login_key,
                               "?email=&password=&application_id=42"
                               "&signature=8e0b9a70f0ee010cf40f269127a47b6ae4614714&version=2"}));

} // namespace
} // namespace quillmere_test
