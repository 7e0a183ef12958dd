// Which of several settings counts: the command line, the environment, the configuration file, the
// session, the defaults.
#include "settings.h"

#include <map>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "failure.h"
#include "support/certificates.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::HasSubstr;

class Settings : public testing::Test {
protected:
    settings decided() const
    {
        return decide_settings(given, {surroundings,
                                       configured,
                                       signed_in,
                                       "https://default",
                                       {folder.path_of("absent"), system_bundle}});
    }

    exit_code code_of_failure() const
    {
        try {
            decided();
        } catch (const failure &problem) {
            return problem.code;
        }
        return exit_code::done;
    }

    std::string ca_named(const std::string &name) const
    {
        return folder.write(name, content_of(test_root_path()));
    }

    std::string ready_file(const std::string &name = "ready.json") const
    {
        return folder.write(name, "{\"https_port\": 1, \"http_port\": 2,"
                                  " \"https_url\": \"https://127.0.0.1:1\","
                                  " \"http_url\": \"http://127.0.0.1:2\","
                                  " \"ca_file\": \"" +
                                      ca_named("emulator.pem") + "\", \"pid\": 3}");
    }

    temporary_folder folder;
    std::map<std::string, std::string> variables;
    const environment surroundings{[this](const char *name) {
        const auto found = variables.find(name);
        return found == variables.end() ? nullptr : found->second.c_str();
    }};
    common_arguments given;
    profile configured;
    std::optional<session> signed_in;
    const std::string system_bundle = ca_named("system.pem");
};

TEST_F(Settings, DefaultToTheLibrarysServiceAndTheSystemsBundle)
{
    const settings chosen = decided();

    EXPECT_EQ(chosen.addresses.secure, "https://default");
    ASSERT_TRUE(chosen.ca.has_value());
    EXPECT_EQ(chosen.ca->path, system_bundle);
    EXPECT_EQ(chosen.timeout_seconds, 30);
    EXPECT_EQ(chosen.retries, 4);
    EXPECT_FALSE(chosen.emulator.has_value());
}

TEST_F(Settings, TakeTheServiceFromTheNearestSource)
{
    signed_in = session{"https://session", "", "t"};
    EXPECT_EQ(decided().addresses.secure, "https://session");

    configured.set("service", "https://configured");
    EXPECT_EQ(decided().addresses.secure, "https://configured");

    variables["QUILLMERE_SERVICE"] = "https://variable";
    EXPECT_EQ(decided().addresses.secure, "https://variable");

    given.service = "https://Flag/";
    EXPECT_EQ(decided().addresses.secure, "https://flag");
}

TEST_F(Settings, TakeTheEmulatorsAddressesAndRoot)
{
    configured.set("service", "https://configured");
    variables["QUILLMERE_EMULATOR"] = ready_file();

    const settings chosen = decided();

    EXPECT_EQ(chosen.addresses.secure, "https://127.0.0.1:1");
    EXPECT_TRUE(chosen.emulator.has_value());
    ASSERT_TRUE(chosen.ca.has_value());
    EXPECT_EQ(chosen.ca->path, folder.path_of("emulator.pem"));
    EXPECT_EQ(chosen.ca->source, "the emulator");
}

TEST_F(Settings, LetTheCommandLineDecideBetweenServiceAndEmulator)
{
    variables["QUILLMERE_EMULATOR"] = ready_file();
    given.service = "https://flag";
    EXPECT_FALSE(decided().emulator.has_value());

    variables = {{"QUILLMERE_SERVICE", "https://variable"}};
    given.service.reset();
    given.emulator = ready_file();
    EXPECT_TRUE(decided().emulator.has_value());
}

TEST_F(Settings, RefuseAnEnvironmentThatContradictsItself)
{
    variables = {{"QUILLMERE_SERVICE", "https://variable"}, {"QUILLMERE_EMULATOR", ready_file()}};

    EXPECT_EQ(code_of_failure(), exit_code::usage);
}

TEST_F(Settings, RefuseAReadyFileThatIsNone)
{
    for (const char *text : {"", "{", "[]", "{}", "{\"https_url\": 1}"}) {
        given.emulator = folder.write("ready.json", text);
        EXPECT_EQ(code_of_failure(), exit_code::local_file) << text;
    }
    given.emulator = folder.path_of("absent");
    EXPECT_EQ(code_of_failure(), exit_code::local_file);
}

TEST_F(Settings, TakeTheBundleFromTheNearestSource)
{
    given.emulator = ready_file();
    EXPECT_EQ(decided().ca->path, folder.path_of("emulator.pem"));

    variables["SSL_CERT_FILE"] = ca_named("variable.pem");
    EXPECT_EQ(decided().ca->path, folder.path_of("variable.pem"));
    EXPECT_EQ(decided().ca->source, "SSL_CERT_FILE");

    configured.set("ca_file", ca_named("configured.pem"));
    EXPECT_EQ(decided().ca->path, folder.path_of("configured.pem"));

    given.ca_file = ca_named("flag.pem");
    EXPECT_EQ(decided().ca->path, folder.path_of("flag.pem"));
}

TEST_F(Settings, DoNotFallBackFromABundleThatWasNamed)
{
    given.ca_file = folder.path_of("absent");
    EXPECT_EQ(code_of_failure(), exit_code::local_file);

    given.ca_file = folder.write("empty.pem", "");
    EXPECT_EQ(code_of_failure(), exit_code::local_file);

    given.ca_file = folder.path();
    EXPECT_EQ(code_of_failure(), exit_code::local_file);
}

TEST_F(Settings, FailWithoutAnyBundle)
{
    EXPECT_THROW(choose_ca_bundle({std::nullopt, std::nullopt, std::nullopt, std::nullopt, {}}),
                 failure);
}

TEST_F(Settings, HaveNoBundleOnlyWhenVerificationIsOff)
{
    given.insecure = true;
    variables["SSL_CERT_FILE"] = folder.path_of("absent");

    EXPECT_FALSE(decided().ca.has_value());
}

TEST_F(Settings, PointThePlainAddressAtTheSecureOne)
{
    given.emulator = ready_file();

    const service_addresses addresses = decided().addresses;

    EXPECT_EQ(addresses.plain, "https://127.0.0.1:1");
    EXPECT_EQ(addresses.plain_upload, "http://127.0.0.1:2/api/upload/upload.php?type=desktop")
        << "which uploads to this machine alone use";
    EXPECT_EQ(addresses.secure_upload, "https://127.0.0.1:1/api/upload/upload.php?type=desktop");
}

TEST_F(Settings, LeaveThemPlainWhenAsked)
{
    given.plain_http = true;
    given.emulator = ready_file();
    EXPECT_EQ(decided().addresses.plain, "http://127.0.0.1:2");
    EXPECT_EQ(decided().addresses.plain_upload,
              "http://127.0.0.1:2/api/upload/upload.php?type=desktop");
    EXPECT_EQ(decided().addresses.secure, "https://127.0.0.1:1");

    given.emulator.reset();
    given.service = "https://host:443/base";
    EXPECT_EQ(decided().addresses.plain, "http://host/base");

    given.service = "https://[::1]";
    EXPECT_EQ(decided().addresses.plain, "http://[::1]");

    given.service = "https://host:8443";
    EXPECT_EQ(code_of_failure(), exit_code::usage);
}

TEST_F(Settings, TakeNumbersFromTheNearestSource)
{
    configured.set("timeout", "7");
    configured.set("retries", "0");
    EXPECT_EQ(decided().timeout_seconds, 7);
    EXPECT_EQ(decided().retries, 0);

    given.timeout = 8;
    given.retries = 9;
    EXPECT_EQ(decided().timeout_seconds, 8);
    EXPECT_EQ(decided().retries, 9);
}

TEST_F(Settings, TakeTheProxyFromTheNearestSource)
{
    EXPECT_FALSE(decided().proxy.has_value());

    configured.set("proxy", "http://configured:3128");
    EXPECT_EQ(decided().proxy->url, "http://configured:3128");

    for (const char *variable : {"https_proxy", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"}) {
        variables = {{variable, "http://variable"}};
        EXPECT_FALSE(decided().proxy.has_value()) << variable << ", which the library reads";
    }

    given.proxy = "flag:80";
    EXPECT_EQ(decided().proxy->url, "flag:80");
    EXPECT_EQ(decided().proxy->source, "--proxy");
}

TEST_F(Settings, RefuseAProxyThatTellsAPasswordOrIsNone)
{
    for (const char *proxy :
         {"http://a:b@host", "a:b@host:1", "http://", "http://a b", "a\nb", "ht tp://a"}) {
        given.proxy = proxy;
        EXPECT_EQ(code_of_failure(), exit_code::usage) << proxy;
        given.proxy.reset();
        configured.set("proxy", proxy);
        EXPECT_EQ(code_of_failure(), exit_code::local_file) << proxy;
        configured = {};
    }
    given.proxy = "http://user@[::1]:3128";
    EXPECT_EQ(code_of_failure(), exit_code::done);
}

TEST_F(Settings, TakeTheSessionFileFromTheNearestSource)
{
    variables["HOME"] = "/home/a";
    const auto path = [&] { return choose_session_file(given, surroundings, configured).path(); };
    EXPECT_EQ(path(), "/home/a/.local/state/quillmere/session.json");

    configured.set("session_file", "~/sessions/work");
    EXPECT_EQ(path(), "/home/a/sessions/work");
    configured.set("session_file", "/sessions/work");
    EXPECT_EQ(path(), "/sessions/work");

    variables["QUILLMERE_SESSION_FILE"] = "variable";
    EXPECT_EQ(path(), "variable");

    given.session_file = "flag";
    EXPECT_EQ(path(), "flag");
}

TEST_F(Settings, RefuseASessionFileThatDependsOnTheWorkingFolder)
{
    configured.set("session_file", "work.json");

    EXPECT_THROW(choose_session_file(given, surroundings, configured), failure);
}

TEST_F(Settings, RefuseNumbersThatAreNone)
{
    for (const char *text : {"x", "7x", "-1", "0", "99999999999"}) {
        configured.set("timeout", text);
        EXPECT_EQ(code_of_failure(), exit_code::local_file) << text;
    }
}

TEST(BaseAddress, IsBroughtToOneForm)
{
    EXPECT_EQ(normal_base_address(" HTTPS://Host.Example:8443/Path// ", "x"),
              "https://host.example:8443/Path");
    EXPECT_EQ(normal_base_address("https://[::1]:8443", "x"), "https://[::1]:8443");
}

TEST(BaseAddress, IsRefusedWhenItIsNone)
{
    for (const char *address :
         {"", "https://", "https:///path", "http://host", "host", "ftp://host", "https://a b",
          "https://user@host", "https://host?x", "https://host#x", "https://:8443",
          "https://h\n"
          "x",
          "https://h\xc3\xa4"})
        EXPECT_THROW(normal_base_address(address, "--service"), failure) << address;
}

} // namespace
} // namespace quillmere_test
