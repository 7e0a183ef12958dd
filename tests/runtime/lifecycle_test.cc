// Starting and stopping the library, and starting it again.
#include <gtest/gtest.h>

#include <signal.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "quillmere.h"
#include "support/globals_guard.h"
#include "support/library_fixture.h"
#include "support/log_capture.h"
#include "support/resources.h"

namespace quillmere_test {
namespace {

class Lifecycle : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
};

int32_t other_hook(const char *, const char *, int32_t, const char *) { return 0; }

TEST_F(Lifecycle, StartCopiesTheCertificatePath)
{
    std::string path = "/somewhere/roots.pem";

    api_global_init(path.c_str());
    path.assign(path.size(), 'x');

    EXPECT_STREQ(ca_cert_pem_path.path, "/somewhere/roots.pem");
    api_global_cleanup();
}

TEST_F(Lifecycle, StartWithoutAPathLeavesNone)
{
    api_global_init(nullptr);

    EXPECT_EQ(ca_cert_pem_path.path, nullptr);
    api_global_cleanup();
}

TEST_F(Lifecycle, StartWithoutAPathLeavesTheOneThatWasStored)
{
    replace_owned_text(ca_cert_pem_path.path, "/stored/before.pem");

    api_global_init(nullptr);

    EXPECT_STREQ(ca_cert_pem_path.path, "/stored/before.pem");
    api_global_cleanup();
}

TEST_F(Lifecycle, StartReplacesAPathThatWasStored)
{
    replace_owned_text(ca_cert_pem_path.path, "/stored/before.pem");

    api_global_init("/another.pem");

    EXPECT_STREQ(ca_cert_pem_path.path, "/another.pem");
    api_global_cleanup();
}

TEST_F(Lifecycle, StartTakesThePathThatIsStoredAlready)
{
    replace_owned_text(ca_cert_pem_path.path, "/stored/before.pem");

    api_global_init(ca_cert_pem_path.path);

    EXPECT_STREQ(ca_cert_pem_path.path, "/stored/before.pem");
    api_global_cleanup();
}

TEST_F(Lifecycle, StartDoesNotReadTheCertificates)
{
    api_global_init("/no/such/file.pem");

    EXPECT_STREQ(ca_cert_pem_path.path, "/no/such/file.pem");
    api_global_cleanup();
}

TEST_F(Lifecycle, StartLogsWhatTlsInitLogsAndNoMore)
{
    tls_init();
    std::string versions = log.text();
    log.clear();

    api_global_init(nullptr);

    EXPECT_NE(versions, "");
    EXPECT_EQ(log.text(), versions);
    api_global_cleanup();
}

TEST_F(Lifecycle, StartLeavesTheSettingsThatWereMadeBeforeIt)
{
    set_default_timeout(7);
    set_connection_attempts(2);
    set_user_proxy("proxy.example", 3128, "someone", "secret");
    proxy_server.enabled = 1;
    ssl_disabled = 1;
    std::FILE *stream = output_file;

    api_global_init(nullptr);

    EXPECT_EQ(ca_cert_pem_path.default_timeout, 7);
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 2);
    EXPECT_EQ(proxy_server.enabled, 1);
    EXPECT_STREQ(proxy_server.host, "proxy.example");
    EXPECT_EQ(proxy_server.port, 3128);
    EXPECT_EQ(ssl_disabled, 1);
    EXPECT_EQ(output_file, stream);
    api_global_cleanup();
}

TEST_F(Lifecycle, StopForgetsTheCertificatePath)
{
    api_global_init("/somewhere/roots.pem");

    api_global_cleanup();

    EXPECT_EQ(ca_cert_pem_path.path, nullptr);
}

TEST_F(Lifecycle, StopClearsTheProxy)
{
    api_global_init(nullptr);
    set_user_proxy("proxy.example", 3128, "someone", "secret");
    proxy_server.enabled = 1;

    api_global_cleanup();

    EXPECT_EQ(proxy_server.enabled, 0);
    EXPECT_EQ(proxy_server.host, nullptr);
    EXPECT_EQ(proxy_server.user, nullptr);
    EXPECT_EQ(proxy_server.password, nullptr);
    EXPECT_EQ(proxy_server.port, 0);
}

TEST_F(Lifecycle, StopKeepsTheOtherSettings)
{
    api_global_init(nullptr);
    set_default_timeout(7);
    set_connection_attempts(2);
    ssl_disabled = 1;
    check_api_error = other_hook;
    api_version = "3";
    urls[1] = "https://elsewhere.example";
    std::FILE *stream = output_file;

    api_global_cleanup();

    EXPECT_EQ(ca_cert_pem_path.default_timeout, 7);
    EXPECT_EQ(ca_cert_pem_path.connection_attempts, 2);
    EXPECT_EQ(ssl_disabled, 1);
    EXPECT_EQ(check_api_error, &other_hook);
    EXPECT_STREQ(api_version, "3");
    EXPECT_STREQ(urls[1], "https://elsewhere.example");
    EXPECT_EQ(output_file, stream);
}

TEST_F(Lifecycle, StopLogsNothing)
{
    api_global_init(nullptr);
    log.clear();

    api_global_cleanup();

    EXPECT_EQ(log.text(), "");
}

TEST_F(Lifecycle, StopLeavesLogAndDigestsUsable)
{
    api_global_init(nullptr);
    api_global_cleanup();
    log.clear();

    char digest[41];
    int32_t result = simple_sha1("", 0, digest, sizeof digest);
    qm_printf("%s", digest);

    EXPECT_EQ(result, 0);
    EXPECT_EQ(log.text(), "da39a3ee5e6b4b0d3255bfef95601890afd80709");
}

TEST_F(Lifecycle, AHundredStartsAndStopsLeaveNoDescriptorAndNoThread)
{
    api_global_init("/somewhere/roots.pem");
    api_global_cleanup();
    size_t descriptors_before = open_descriptors();
    size_t threads_before = threads();

    for (int round = 0; round < 100; ++round) {
        api_global_init("/somewhere/roots.pem");
        api_global_cleanup();
    }

    EXPECT_EQ(open_descriptors(), descriptors_before);
    EXPECT_EQ(threads(), threads_before);
}

void (*handler_of(int signal_number))(int)
{
    struct sigaction action = {};
    return sigaction(signal_number, nullptr, &action) == 0 ? action.sa_handler : SIG_ERR;
}

std::vector<void (*)(int)> signal_handlers()
{
    std::vector<void (*)(int)> handlers;
    for (int signal_number = 1; signal_number < SIGRTMAX; ++signal_number)
        handlers.push_back(handler_of(signal_number));
    return handlers;
}

const char *const status_reply = "<response><result>Success</result><db>Live</db></response>";

class RunningLibrary : public library_test {
protected:
    int32_t status_of_a_request()
    {
        system_status *record = nullptr;
        char *error = nullptr;
        int32_t status = get_system_status(&record, &error);
        system_status_delete(&record);
        api_free(error);
        return status;
    }
};

TEST_F(RunningLibrary, InstallsNoSignalHandler)
{
    std::vector<void (*)(int)> before = signal_handlers();
    server.answer(xml_reply(status_reply));

    api_global_cleanup();
    api_global_init(test_root_path().c_str());
    ASSERT_EQ(status_of_a_request(), QM_OK);

    EXPECT_EQ(signal_handlers(), before);
}

TEST_F(RunningLibrary, HasNoThreadOfItsOwn)
{
    server.answer(xml_reply(status_reply));
    size_t before = threads();

    ASSERT_EQ(status_of_a_request(), QM_OK);
    ASSERT_TRUE(server.wait_until_idle());

    EXPECT_EQ(threads(), before);
}

TEST_F(RunningLibrary, LeavesNoDescriptorBehindARequest)
{
    server.answer(xml_reply(status_reply));
    ASSERT_EQ(status_of_a_request(), QM_OK);
    ASSERT_TRUE(server.wait_until_idle());
    size_t before = open_descriptors();

    ASSERT_EQ(status_of_a_request(), QM_OK);
    ASSERT_TRUE(server.wait_until_idle());

    EXPECT_EQ(open_descriptors(), before);
}

TEST_F(RunningLibrary, WorksAfterBeingStoppedAndStartedAgain)
{
    server.answer(xml_reply(status_reply));

    for (int round = 0; round < 3; ++round) {
        api_global_cleanup();
        api_global_init(test_root_path().c_str());
        EXPECT_EQ(status_of_a_request(), QM_OK);
    }

    EXPECT_EQ(server.requests().size(), 3u);
}

TEST_F(RunningLibrary, NeverLooksAtWhatTestHarnessesKeep)
{
    server.answer(xml_reply(status_reply));
    int anything = 0;
    debug_replace_get_response_from_url = &anything;

    EXPECT_EQ(status_of_a_request(), QM_OK);

    EXPECT_EQ(debug_replace_get_response_from_url, &anything);
    EXPECT_EQ(anything, 0);
    EXPECT_EQ(server.requests().size(), 1u);
}

TEST_F(RunningLibrary, ReadsItsSettingsAfreshForEveryRequest)
{
    server.next({closing(), closing(), answering(xml_reply(status_reply))});

    set_connection_attempts(2);
    EXPECT_EQ(status_of_a_request(), QM_NO_RESPONSE);
    EXPECT_EQ(server.connections(), 2u);

    ca_cert_pem_path.connection_attempts = 1;
    EXPECT_EQ(status_of_a_request(), QM_OK);
    EXPECT_EQ(server.connections(), 3u);
}

} // namespace
} // namespace quillmere_test
