#include "router.h"

#include <set>
#include <string>

#include <gtest/gtest.h>

#include "digest.h"
#include "errors.h"
#include "scratch_directory.h"
#include "socket_client.h"
#include "store/accounts.h"
#include "store/applications.h"
#include "store/content.h"
#include "store/database.h"

using namespace emulator;

namespace {

const std::string key = "quillmere-development-key";

class Router : public testing::Test {
protected:
    Router() { add_account(store, {"ann@example.org", "p & w", "fb-token"}, time); }

    reply get(const std::string &target) { return answer({"GET", target, {}, {}}, state); }

    reply log_in(const std::string &signature)
    {
        return get("/api/user/get_session_token.php?application_id=42&email=ann%40example.org"
                   "&password=p%20%26%20w&signature=" +
                   signature + "&version=2");
    }

    std::string session()
    {
        return element(log_in(sha1_hex("ann@example.orgp & w42" + key)).body, "session_token");
    }

    reply device_status(const std::string &token)
    {
        return get("/api/device/get_status.php?session_token=" + token + "&device_id=0&version=2");
    }

    scratch_directory scratch;
    database store{scratch.path() / "store.sqlite"};
    std::int64_t time = 1000;
    content_store content{scratch.path() / "content"};
    service state{store, content, [this] { return time; }, 600};
};

std::string number_of(const reply &made) { return element(made.body, "error"); }

} // namespace

TEST_F(Router, WrapsASuccessInTheEnvelope)
{
    const reply made = get("/api/system/get_status.php");

    EXPECT_EQ(made.http_status, 200u);
    EXPECT_EQ(made.body, "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                         "<response><action>system/get_status</action><database>live</database>"
                         "<memcache>none</memcache><result>Success</result>"
                         "<current_api_version>2.13</current_api_version></response>");
}

TEST_F(Router, WrapsAnErrorInTheEnvelope)
{
    const reply made = device_status("none");

    EXPECT_EQ(made.http_status, 403u);
    EXPECT_EQ(made.body,
              "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
              "<response><action>device/get_status</action>"
              "<message>The session token is invalid or has expired</message><error>105</error>"
              "<result>Error</result><current_api_version>2.13</current_api_version></response>");
}

TEST_F(Router, KnowsNoOtherPath)
{
    for (const char *target : {"/", "", "/api/system/get_status", "/api/system/get_status.php/",
                               "/api/<script>.php", "//api/system/get_status.php"}) {
        const reply made = get(target);
        EXPECT_EQ(made.http_status, 404u) << target;
        EXPECT_EQ(number_of(made), "101") << target;
        EXPECT_EQ(made.body.find("script"), std::string::npos);
    }
}

TEST_F(Router, KnowsNoOtherMethod)
{
    const reply made = answer({"DELETE", "/api/system/get_status.php", {}, {}}, state);

    EXPECT_EQ(made.http_status, 405u);
    EXPECT_EQ(number_of(made), "102");
}

TEST_F(Router, RefusesAMalformedQuery)
{
    const reply made = get("/api/system/get_status.php?a=%zz");

    EXPECT_EQ(made.http_status, 400u);
    EXPECT_EQ(number_of(made), "103");
}

TEST_F(Router, TakesParametersFromTheBodyToo)
{
    const std::string token = session();

    const reply made =
        answer({"POST", "/api/device/get_status.php?device_id=7",
                "application/x-www-form-urlencoded; charset=utf-8", "session_token=" + token},
               state);

    EXPECT_EQ(made.http_status, 200u) << made.body;
}

TEST_F(Router, RefusesAParameterInBothQueryAndBody)
{
    const reply made = answer({"POST", "/api/device/get_status.php?device_id=7",
                               "application/x-www-form-urlencoded", "device_id=7"},
                              state);

    EXPECT_EQ(number_of(made), "103");
}

TEST_F(Router, RefusesABodyThatIsNoForm)
{
    const reply made =
        answer({"POST", "/api/system/get_status.php", "application/json", "{}"}, state);

    EXPECT_EQ(made.http_status, 415u);
    EXPECT_EQ(number_of(made), "111");
}

TEST_F(Router, SaysThatAFailureOfItsOwnIsItsOwn)
{
    store.execute("DROP TABLE sessions");

    testing::internal::CaptureStderr();
    const reply made = device_status("any");
    const std::string log = testing::internal::GetCapturedStderr();

    EXPECT_EQ(made.http_status, 500u);
    EXPECT_EQ(number_of(made), "100");
    EXPECT_EQ(made.body.find("sessions"), std::string::npos);
    EXPECT_NE(log.find("sessions"), std::string::npos);
}

TEST_F(Router, ReportsAStoreThatDoesNotAnswer)
{
    store.execute("PRAGMA foreign_keys = OFF; DROP TABLE accounts");

    testing::internal::CaptureStderr();
    const reply made = get("/api/system/get_status.php");
    testing::internal::GetCapturedStderr();

    EXPECT_EQ(element(made.body, "database"), "down");
}

TEST_F(Router, AnswersEveryEndpointOfTheTable)
{
    for (const endpoint &row : endpoint_table()) {
        const reply made = get(row.path);
        EXPECT_NE(number_of(made), "100") << row.path;
        EXPECT_NE(number_of(made), "101") << row.path;
    }
}

TEST_F(Router, ListsTheLimitsOfTheService)
{
    const std::string body = get("/api/system/get_limits.php").body;

    for (const char *name :
         {"max_objects", "max_keys", "max_image_size", "zip_max_filesize", "zip_max_total_filesize",
          "folder_content_chunk_size", "folder_depth_limit", "limit_search_results",
          "daily_shares_limit", "device_changes_list_limit"})
        EXPECT_GT(std::stoull(element(body, name)), 0u) << name;
    EXPECT_EQ(element(body, "folder_content_chunk_size"), "100");
    EXPECT_EQ(element(body, "device_changes_list_limit"), "500");
}

TEST_F(Router, ErrorNumbersAreDistinctAndPositive)
{
    std::set<int> seen;
    for (const error_row &row : error_table()) {
        EXPECT_GT(static_cast<int>(row.number), 0);
        EXPECT_TRUE(seen.insert(static_cast<int>(row.number)).second);
        EXPECT_GE(row.http_status, 400u);
    }
}

TEST_F(Router, LogsInWithASignedPassword)
{
    // SHA-1 of "ann@example.orgp & w42quillmere-development-key", computed elsewhere.
    const reply made = log_in("ece705544f3bb2d81005bddc56ae110ccac1a120");

    EXPECT_EQ(made.http_status, 200u) << made.body;
    EXPECT_EQ(element(made.body, "session_token").size(), 64u);
}

TEST_F(Router, RefusesAnyOtherSignature)
{
    const std::string right = sha1_hex("ann@example.orgp & w42" + key);
    std::string one_digit_off = right;
    one_digit_off.back() = one_digit_off.back() == '0' ? '1' : '0';

    for (const std::string &signature :
         {one_digit_off, right.substr(1), right + "0",
          sha1_hex("ann@example.orgp%20%26%20w42" + key), sha1_hex("42" + key)}) {
        const reply made = log_in(signature);
        EXPECT_EQ(made.http_status, 403u);
        EXPECT_EQ(number_of(made), "109");
    }
}

TEST_F(Router, RefusesAMissingSignature) { EXPECT_EQ(number_of(log_in("")), "104"); }

TEST_F(Router, RefusesAnUnknownApplication)
{
    const reply made = get("/api/user/get_session_token.php?application_id=43&email=a&password=b"
                           "&signature=" +
                           sha1_hex("ab43" + key));

    EXPECT_EQ(number_of(made), "108");
}

TEST_F(Router, AcceptsAnotherRegisteredApplication)
{
    put_application(store, {"43", "other"});

    const reply made = get("/api/user/get_session_token.php?application_id=43"
                           "&email=ann%40example.org&password=p%20%26%20w&signature=" +
                           sha1_hex("ann@example.orgp & w43other"));

    EXPECT_EQ(made.http_status, 200u);
}

TEST_F(Router, RefusesAWrongPasswordWithARightSignature)
{
    const reply made = get("/api/user/get_session_token.php?application_id=42"
                           "&email=ann%40example.org&password=wrong&signature=" +
                           sha1_hex("ann@example.orgwrong42" + key));

    EXPECT_EQ(made.http_status, 403u);
    EXPECT_EQ(number_of(made), "107");
    EXPECT_EQ(element(made.body, "session_token"), "");
}

TEST_F(Router, RefusesAnUnknownAddressInTheSameWords)
{
    const reply unknown = get("/api/user/get_session_token.php?application_id=42&email=bob"
                              "&password=p&signature=" +
                              sha1_hex("bobp42" + key));
    const reply wrong = get("/api/user/get_session_token.php?application_id=42"
                            "&email=ann%40example.org&password=p&signature=" +
                            sha1_hex("ann@example.orgp42" + key));

    EXPECT_EQ(unknown.body, wrong.body);
}

TEST_F(Router, LogsInWithASignedFacebookToken)
{
    const reply made = get("/api/user/get_session_token.php?application_id=42"
                           "&fb_access_token=fb-token&signature=" +
                           sha1_hex("fb-token42" + key));

    EXPECT_EQ(made.http_status, 200u) << made.body;
}

TEST_F(Router, UsesTheFacebookTokenWhenThePasswordIsEmpty)
{
    const reply made = get("/api/user/get_session_token.php?application_id=42&email=ann&password="
                           "&fb_access_token=fb-token&signature=" +
                           sha1_hex("fb-token42" + key));

    EXPECT_EQ(made.http_status, 200u) << made.body;
}

TEST_F(Router, PrefersThePasswordToTheFacebookToken)
{
    const reply made = get("/api/user/get_session_token.php?application_id=42"
                           "&email=ann%40example.org&password=wrong&fb_access_token=fb-token"
                           "&signature=" +
                           sha1_hex("ann@example.orgwrong42" + key));

    EXPECT_EQ(number_of(made), "107");
}

TEST_F(Router, RefusesAnUnknownFacebookToken)
{
    const reply made = get("/api/user/get_session_token.php?application_id=42"
                           "&fb_access_token=other&signature=" +
                           sha1_hex("other42" + key));

    EXPECT_EQ(number_of(made), "107");
}

TEST_F(Router, AsksForCredentials)
{
    const reply made =
        get("/api/user/get_session_token.php?application_id=42&signature=" + sha1_hex("42" + key));

    EXPECT_EQ(number_of(made), "104");
    EXPECT_EQ(element(made.body, "message"), "Required parameter missing: email");
}

TEST_F(Router, GivesALoginTokenAndThePkey)
{
    const std::string target = "/api/user/get_login_token.php?email=ann%40example.org"
                               "&password=p%20%26%20w&application_id=42&signature=" +
                               sha1_hex("ann@example.orgp & w42" + key) + "&version=2";
    const reply one = get(target);
    const reply other = get(target);

    EXPECT_EQ(element(one.body, "login_token").size(), 64u) << one.body;
    EXPECT_NE(element(one.body, "login_token"), element(other.body, "login_token"));
    EXPECT_FALSE(element(one.body, "pkey").empty());
    EXPECT_EQ(element(one.body, "pkey"), element(other.body, "pkey"));
}

TEST_F(Router, LoginTokenIsNoSession)
{
    const reply made = get("/api/user/get_login_token.php?email=ann%40example.org"
                           "&password=p%20%26%20w&application_id=42&signature=" +
                           sha1_hex("ann@example.orgp & w42" + key));

    EXPECT_EQ(number_of(device_status(element(made.body, "login_token"))), "105");
}

TEST_F(Router, RenewalEndsTheOldToken)
{
    const std::string old = session();

    const std::string renewed =
        element(get("/api/user/renew_session_token.php?session_token=" + old + "&version=2").body,
                "session_token");

    EXPECT_EQ(device_status(renewed).http_status, 200u);
    EXPECT_EQ(number_of(device_status(old)), "105");
    EXPECT_EQ(number_of(get("/api/user/renew_session_token.php?session_token=" + old)), "105");
    EXPECT_EQ(number_of(get("/api/user/renew_session_token.php")), "105");
}

TEST_F(Router, SessionExpiresWhenUnused)
{
    const std::string token = session();

    time += 599;
    EXPECT_EQ(device_status(token).http_status, 200u);
    time += 600;
    EXPECT_EQ(number_of(device_status(token)), "105");
}

TEST_F(Router, TellsADeviceTheRevisionOfTheTree)
{
    const std::string token = session();
    store.execute("UPDATE accounts SET revision = 9007199254740993");

    const reply made = device_status(token);

    EXPECT_EQ(element(made.body, "device_revision"), "9007199254740993");
    EXPECT_EQ(element(made.body, "async_jobs_in_progress"), "no");
}

TEST_F(Router, WantsADeviceIdOf32Bits)
{
    const std::string target = "/api/device/get_status.php?session_token=" + session();

    EXPECT_EQ(get(target + "&device_id=4294967295").http_status, 200u);
    EXPECT_EQ(number_of(get(target + "&device_id=4294967296")), "106");
    EXPECT_EQ(number_of(get(target + "&device_id=-1")), "106");
    EXPECT_EQ(number_of(get(target + "&device_id=one")), "106");
    EXPECT_EQ(number_of(get(target)), "104");
}
