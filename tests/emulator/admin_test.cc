#include "admin.h"

#include <stdexcept>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

using namespace emulator;
using nlohmann::json;

namespace {

class Admin : public testing::Test {
protected:
    reply ask(const std::string &method, const std::string &target, const std::string &body = {})
    {
        request asked{method, target, "application/json", body};
        asked.web_page = web_page;
        return administer(asked, {faults, requests, [this] { reset(); }, [] { return 1; }});
    }

    json told(const std::string &target) { return json::parse(ask("GET", target).body); }

    void reset()
    {
        ++resets;
        if (reset_fails)
            throw std::runtime_error("secret");
    }

    fault_list faults;
    request_counts requests;
    std::string web_page;
    int resets = 0;
    bool reset_fails = false;
};

} // namespace

TEST_F(Admin, TellsThatItIsThere)
{
    const reply made = ask("GET", "/health");

    EXPECT_EQ(made.http_status, 200u);
    EXPECT_EQ(json::parse(made.body).at("status"), "ok");
    EXPECT_EQ(made.fields.at(0).value, "application/json");
}

TEST_F(Admin, PlacesAFaultAndTellsIt)
{
    const reply made = ask("POST", "/faults", R"({"kind": "stall"})");
    faults.strike_request("/a");

    EXPECT_EQ(made.http_status, 201u);
    EXPECT_EQ(json::parse(made.body), json({{"id", 1}}));
    const json listed = told("/faults");
    EXPECT_EQ(listed.at("faults").size(), 1u);
    EXPECT_EQ(listed.at("faults").at(0), told("/faults/1"));
    EXPECT_EQ(told("/faults/1").at("fired"), 1);
}

TEST_F(Admin, RemovesOneFaultOrAll)
{
    for (int number = 0; number < 3; ++number)
        ask("POST", "/faults", R"({"kind": "stall"})");

    EXPECT_EQ(ask("DELETE", "/faults/2").http_status, 200u);
    EXPECT_EQ(ask("DELETE", "/faults/2").http_status, 404u);
    EXPECT_EQ(told("/faults").at("faults").size(), 2u);
    EXPECT_EQ(ask("DELETE", "/faults").http_status, 200u);
    EXPECT_TRUE(faults.all().empty());
}

TEST_F(Admin, ExplainsARefusedFault)
{
    const reply made = ask("POST", "/faults", R"({"kind": "delay"})");

    EXPECT_EQ(made.http_status, 400u);
    EXPECT_EQ(json::parse(made.body), json({{"error", "\"milliseconds\" is missing"}}));
    EXPECT_TRUE(faults.all().empty());
}

TEST_F(Admin, RefusesMoreFaultsThanItHolds)
{
    for (std::size_t number = 0; number < fault_list::most; ++number)
        ASSERT_EQ(ask("POST", "/faults", R"({"kind": "stall"})").http_status, 201u);

    const reply made = ask("POST", "/faults", R"({"kind": "stall"})");

    EXPECT_EQ(made.http_status, 409u);
    EXPECT_NE(made.body.find("256"), std::string::npos);
}

TEST_F(Admin, RefusesAFaultWhoseNameIsNoUtf8)
{
    EXPECT_EQ(ask("POST", "/faults", "{\"kind\": \"stall\", \"\xff\": 1}").http_status, 400u);
}

TEST_F(Admin, Resets)
{
    EXPECT_EQ(ask("POST", "/reset").http_status, 200u);
    EXPECT_EQ(resets, 1);
}

TEST_F(Admin, TellsOfAFailureOfItsOwnWithoutTheReason)
{
    reset_fails = true;
    testing::internal::CaptureStderr();

    const reply made = ask("POST", "/reset");

    EXPECT_EQ(testing::internal::GetCapturedStderr(), "quillmere-emulator: admin: secret\n");
    EXPECT_EQ(made.http_status, 500u);
    EXPECT_EQ(json::parse(made.body), json({{"error", "internal error"}}));
}

TEST_F(Admin, CountsRequestsByEndpoint)
{
    for (const char *path : {"/api/user/get_info.php", "/api/user/get_info.php",
                             "/api/upload/upload.php", "/download/key/name", "/nothing", "/"})
        requests.count(path);

    EXPECT_EQ(told("/requests"), json({{"total", 6},
                                       {"endpoints",
                                        {{"/api/user/get_info.php", 2},
                                         {"/api/upload/upload.php", 1},
                                         {"/download/", 1},
                                         {"other", 2}}}}));
}

TEST_F(Admin, KnowsNoOtherPath)
{
    for (const char *target : {"/", "/fault", "/faults/", "/faults/x", "/faults/1/2", "/faults/-1",
                               "/health/", "/api/user/get_info.php"})
        EXPECT_EQ(ask("GET", target).http_status, 404u) << target;
    EXPECT_EQ(ask("GET", "/health?a=b").http_status, 200u);
}

TEST_F(Admin, SaysWhichMethodsAPathKnows)
{
    const reply made = ask("PUT", "/faults");

    EXPECT_EQ(made.http_status, 405u);
    EXPECT_EQ(json::parse(made.body).at("error"), "this path knows the methods: GET, POST, DELETE");
    EXPECT_STREQ(made.fields.at(1).name, "Allow");
    EXPECT_EQ(made.fields.at(1).value, "GET, POST, DELETE");
    EXPECT_EQ(ask("GET", "/reset").http_status, 405u);
    EXPECT_EQ(ask("POST", "/health").http_status, 405u);
    EXPECT_EQ(resets, 0);
}

TEST_F(Admin, RefusesWhatAWebPageAsks)
{
    web_page = "https://example.org";

    EXPECT_EQ(ask("POST", "/reset").http_status, 403u);
    EXPECT_EQ(resets, 0);
}
