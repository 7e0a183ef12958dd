// The proxy's description: set, switched off and on, cleared.
#include <gtest/gtest.h>

#include <string>

#include "quillmere.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

class Proxy : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
};

void expect_all_zero()
{
    EXPECT_EQ(proxy_server.enabled, 0);
    EXPECT_EQ(proxy_server.host, nullptr);
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.port, 0);
}

TEST_F(Proxy, IsDescribedByCopiesOfTheTexts)
{
    std::string host = "proxy.example";
    std::string user = "someone";
    std::string password = "secret";

    set_user_proxy(host.c_str(), 3128, user.c_str(), password.c_str());
    host.assign(host.size(), 'x');
    user.assign(user.size(), 'x');
    password.assign(password.size(), 'x');

    EXPECT_STREQ(proxy_server.host, "proxy.example");
    EXPECT_STREQ(proxy_server.user, "someone");
    EXPECT_STREQ(proxy_server.password, "secret");
    EXPECT_EQ(proxy_server.port, 3128);
    EXPECT_EQ(log.text(), "");
}

TEST_F(Proxy, IsNotEnabledByBeingDescribed)
{
    set_user_proxy("proxy.example", 3128, nullptr, nullptr);

    EXPECT_EQ(proxy_server.enabled, 0);
}

TEST_F(Proxy, IsNoLongerEnabledAfterANewDescription)
{
    set_user_proxy("proxy.example", 3128, nullptr, nullptr);
    proxy_server.enabled = 1;

    set_user_proxy("other.example", 3128, nullptr, nullptr);

    EXPECT_EQ(proxy_server.enabled, 0);
}

TEST_F(Proxy, IsOnThisHostAtPort80IfNothingIsSaid)
{
    set_user_proxy(nullptr, 0, nullptr, nullptr);

    EXPECT_STREQ(proxy_server.host, "127.0.0.1");
    EXPECT_EQ(proxy_server.port, 80);
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.enabled, 0);
}

TEST_F(Proxy, KeepsEmptyTextsAsTheyAre)
{
    set_user_proxy("", 1, "", "");

    EXPECT_STREQ(proxy_server.host, "");
    EXPECT_STREQ(proxy_server.user, "");
    EXPECT_STREQ(proxy_server.password, "");
}

TEST_F(Proxy, KeepsAUserWithoutAPasswordAndAPasswordWithoutAUser)
{
    set_user_proxy("a", 1, "user", nullptr);
    EXPECT_STREQ(proxy_server.user, "user");
    EXPECT_EQ(proxy_server.password, nullptr);

    set_user_proxy("a", 1, nullptr, "password");
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_STREQ(proxy_server.password, "password");
}

class ProxyPort : public Proxy, public testing::WithParamInterface<int64_t> {};

TEST_P(ProxyPort, IsStoredUnchangedUnlessItIsZero)
{
    set_user_proxy("proxy.example", GetParam(), nullptr, nullptr);

    EXPECT_EQ(proxy_server.port, GetParam());
}

INSTANTIATE_TEST_SUITE_P(Values, ProxyPort,
                         testing::Values(1, 80, 65535, 65536, -1, INT64_MAX, INT64_MIN));

TEST_F(Proxy, IsReplacedAsAWhole)
{
    set_user_proxy("first.example", 1, "first", "one");

    set_user_proxy("second.example", 2, nullptr, nullptr);

    EXPECT_STREQ(proxy_server.host, "second.example");
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.port, 2);
}

TEST_F(Proxy, CanBeDisabledAndEnabledAgain)
{
    set_user_proxy("proxy.example", 3128, "someone", "secret");
    proxy_server.enabled = 1;

    disable_user_proxy();

    EXPECT_EQ(proxy_server.enabled, 0);
    EXPECT_STREQ(proxy_server.host, "proxy.example");
    EXPECT_STREQ(proxy_server.user, "someone");
    EXPECT_STREQ(proxy_server.password, "secret");
    EXPECT_EQ(proxy_server.port, 3128);
}

TEST_F(Proxy, IsAllZeroAfterBeingCleared)
{
    set_user_proxy("proxy.example", 3128, "someone", "secret");
    proxy_server.enabled = 1;

    cleanup_proxy();

    expect_all_zero();
}

TEST_F(Proxy, CanBeClearedTwice)
{
    set_user_proxy("proxy.example", 3128, "someone", "secret");

    cleanup_proxy();
    cleanup_proxy();

    expect_all_zero();
}

} // namespace
} // namespace quillmere_test
