// Proves the parts of the support that hold the library's own state.
#include <gtest/gtest.h>

#include <cstdlib>
#include <thread>

#include "support/library_fixture.h"
#include "support/stdout_capture.h"
#include "support/thread_log.h"

namespace quillmere_test {
namespace {

TEST(LogCapture, HoldsTheLogAndPutsTheStreamBack)
{
    std::FILE *before = output_file;
    {
        log_capture log;
        qm_printf("one %d\n", 1);
        EXPECT_EQ(log.text(), "one 1\n");
        log.clear();
        qm_printf("two\n");
        EXPECT_EQ(log.text(), "two\n");
    }

    EXPECT_EQ(output_file, before);
    stdout_capture out;
    qm_printf("three\n");
    EXPECT_EQ(out.text(), "three\n");
}

TEST(ThreadLog, KeepsTheLinesOfEachThreadApart)
{
    thread_log log;
    std::string others;
    qm_printf("one %d, ", 1);

    std::thread other([&] {
        for (int line = 0; line < 100; ++line)
            qm_printf("two %d\n", 2);
        others = thread_log::take();
    });
    for (int line = 0; line < 100; ++line)
        qm_printf("%s", "more");
    other.join();

    std::string expected = "one 1, ";
    for (int line = 0; line < 100; ++line)
        expected += "more";
    EXPECT_EQ(thread_log::take(), expected);
    EXPECT_EQ(thread_log::take(), "");
    EXPECT_EQ(others.size(), 600u);
    EXPECT_EQ(others.find("more"), std::string::npos);
}

TEST(GlobalsGuard, PutsEveryVariableBack)
{
    globals_guard outer;
    const char *host = urls[1];
    const char *uri = get_login_token_uri;
    set_user_proxy("proxy.example", 3128, "user", nullptr);
    proxy_server.enabled = 5;
    replace_owned_text(ca_cert_pem_path.path, "/before.pem");
    {
        globals_guard guard;
        urls[1] = "changed";
        get_login_token_uri = "changed";
        api_version = "99";
        check_api_error = nullptr;
        ssl_disabled = 1;
        set_default_timeout(77);
        set_connection_attempts(77);
        replace_owned_text(ca_cert_pem_path.path, std::nullopt);
        set_user_proxy("other.example", 1, nullptr, "password");
    }

    EXPECT_EQ(urls[1], host);
    EXPECT_EQ(get_login_token_uri, uri);
    EXPECT_STREQ(api_version, "2");
    EXPECT_EQ(check_api_error, &check_api_error_empty);
    EXPECT_EQ(ssl_disabled, 0);
    EXPECT_EQ(ca_cert_pem_path.default_timeout, 30);
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 6);
    EXPECT_STREQ(ca_cert_pem_path.path, "/before.pem");
    EXPECT_EQ(proxy_server.enabled, 5);
    EXPECT_STREQ(proxy_server.host, "proxy.example");
    EXPECT_STREQ(proxy_server.user, "user");
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.port, 3128);
}

TEST(EnvironmentGuard, PutsVariablesBack)
{
    environment_guard outer;
    outer.set("QM_TEST_VARIABLE", "before");
    outer.unset("QM_TEST_ABSENT");
    {
        environment_guard guard;
        guard.set("QM_TEST_VARIABLE", "one");
        guard.unset("QM_TEST_VARIABLE");
        guard.set("QM_TEST_ABSENT", "present");
        EXPECT_EQ(std::getenv("QM_TEST_VARIABLE"), nullptr);
    }

    EXPECT_STREQ(std::getenv("QM_TEST_VARIABLE"), "before");
    EXPECT_EQ(std::getenv("QM_TEST_ABSENT"), nullptr);
}

TEST(HookRecorder, KeepsEveryCallAndPutsTheHookBack)
{
    {
        hook_recorder hook;
        check_api_error("url", "response", 105, nullptr);
        check_api_error(nullptr, nullptr, -8, "message");

        ASSERT_EQ(hook.calls().size(), 2u);
        EXPECT_EQ(hook.calls()[0].url, "url");
        EXPECT_EQ(hook.calls()[0].response, "response");
        EXPECT_EQ(hook.calls()[0].status, 105);
        EXPECT_EQ(hook.calls()[0].message, std::nullopt);
        EXPECT_EQ(hook.calls()[1].url, std::nullopt);
        EXPECT_EQ(hook.calls()[1].message, "message");
    }

    EXPECT_EQ(check_api_error, &check_api_error_empty);
}

class LibraryFixture : public library_test {};

TEST_F(LibraryFixture, StartsWithAnEmptyLogAndOneAttempt)
{
    EXPECT_EQ(log.text(), "");
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 1);
    EXPECT_EQ(ca_cert_pem_path.path, test_root_path());
    EXPECT_EQ(std::getenv("https_proxy"), nullptr);
}

TEST_F(LibraryFixture, LeadsOperationsToTheTlsServer)
{
    server.answer(xml_reply("<response><result>Error</result><message>no</message>"
                            "<error>105</error></response>"));
    hook_recorder hook;
    char *message = nullptr;
    system_status *status = nullptr;

    int32_t result = get_system_status(&status, &message);

    EXPECT_EQ(result, 105);
    EXPECT_STREQ(message, "no");
    ASSERT_EQ(hook.calls().size(), 1u);
    EXPECT_EQ(hook.calls()[0].url, server.base_url() + "/api/system/get_status.php");
    ASSERT_EQ(server.requests().size(), 1u);
    EXPECT_EQ(server.requests()[0].target, "/api/system/get_status.php");
    EXPECT_EQ(plain_server.connections(), 0u);
    EXPECT_NE(log.text(), "");
    api_free(message);
}

TEST_F(LibraryFixture, CanBeLedToAnotherServer)
{
    scripted_server other(tls_with(certificate_for_another_host()));
    point_at(other);
    char *message = nullptr;
    system_status *status = nullptr;

    EXPECT_EQ(get_system_status(&status, &message), QM_NO_RESPONSE);

    EXPECT_EQ(urls[3], other.base_url() + "/api/upload/upload.php?type=desktop");
    EXPECT_EQ(other.connections(), 1u);
    EXPECT_TRUE(other.wait_until_idle());
    EXPECT_EQ(other.requests().size(), 0u);
    EXPECT_EQ(server.connections(), 0u);
    api_free(message);
}

class LibraryFixtureWithoutAuthority : public library_test {
protected:
    LibraryFixtureWithoutAuthority() : library_test(nullptr) {}
};

TEST_F(LibraryFixtureWithoutAuthority, StartsWithoutAPath)
{
    EXPECT_EQ(ca_cert_pem_path.path, nullptr);
}

} // namespace
} // namespace quillmere_test
