// Programs of every kind that call the library: what they write to its variables is what it uses,
// and their own functions stay theirs.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "support/library_fixture.h"
#include "support/process.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;

const char *const success =
    "<response><result>Success</result><device_revision>42</device_revision>"
    "<async_jobs_in_progress>yes</async_jobs_in_progress></response>";
const char *const refusal = "<response><result>Error</result><error>110</error><message>No such "
                            "device</message></response>";
const char *const target = "/moved/status.php?session_token=token&device_id=7&version=9.9";

struct caller_settings {
    std::string base;
    std::string ca_path = test_root_path();
    int ssl_disabled = 0;
    uint16_t proxy_port = 0;
};

class Caller : public testing::TestWithParam<const char *> {
protected:
    static outcome call(const caller_settings &settings)
    {
        command caller;
        caller.program = GetParam();
        caller.arguments = {QUILLMERE_LIBRARY, settings.base, settings.ca_path,
                            std::to_string(settings.ssl_disabled),
                            std::to_string(settings.proxy_port)};
        return run(caller);
    }

    proxyless_environment environment;
};

TEST_P(Caller, ReachesTheAddressPathAndVersionItSet)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(xml_reply(success));

    outcome result = call({server.base_url()});

    EXPECT_EQ(result.exit_status, 0) << result.err;
    EXPECT_EQ(result.out, "status 0, revision 42, busy 1, error none\n");
    ASSERT_EQ(server.requests().size(), 1u);
    EXPECT_EQ(server.requests()[0].target, target);
}

TEST_P(Caller, FindsTheLogInTheStreamItSet)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(xml_reply(success));

    outcome result = call({server.base_url()});

    EXPECT_THAT(result.report, HasSubstr(server.base_url() + target + "\n"));
    EXPECT_THAT(result.report, HasSubstr("Curl SSL version: "));
    EXPECT_EQ(result.err, "");
}

TEST_P(Caller, IsToldOfARefusalThroughTheHookItSet)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(xml_reply(refusal));

    outcome result = call({server.base_url()});

    EXPECT_EQ(result.out, "hook: " + server.base_url() + target + ", " + refusal +
                              ", 110, No such device\n"
                              "status 110, revision 0, busy 0, error No such device\n");
}

TEST_P(Caller, GetsTheNumberOfAttemptsItSet)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.script(closing());

    outcome result = call({server.base_url()});

    EXPECT_THAT(result.out, HasSubstr("status -2, "));
    EXPECT_EQ(server.connections(), 2u);
}

TEST_P(Caller, IsProtectedFromAnUnknownRootUnlessItSaysOtherwise)
{
    scripted_server server(tls_with(certificate_of_unknown_root()));
    server.answer(xml_reply(success));

    outcome careful = call({server.base_url()});
    caller_settings careless_settings = {server.base_url()};
    careless_settings.ssl_disabled = 1;
    outcome careless = call(careless_settings);

    EXPECT_THAT(careful.out, HasSubstr("status -2, "));
    EXPECT_THAT(careless.out, HasSubstr("status 0, "));
    EXPECT_EQ(server.requests().size(), 1u);
}

TEST_P(Caller, GoesThroughTheProxyItEnabled)
{
    scripted_server proxy;
    proxy.answer(xml_reply(success));
    caller_settings settings = {"http://service.invalid"};
    settings.proxy_port = proxy.port();

    outcome result = call(settings);

    EXPECT_THAT(result.out, HasSubstr("status 0, "));
    ASSERT_EQ(proxy.requests().size(), 1u);
    EXPECT_EQ(proxy.requests()[0].target, std::string("http://service.invalid") + target);
}

INSTANTIATE_TEST_SUITE_P(PositionIndependent, Caller, testing::Values(QUILLMERE_PIE_CALLER));
INSTANTIATE_TEST_SUITE_P(AtAFixedAddress, Caller, testing::Values(QUILLMERE_FIXED_CALLER));
INSTANTIATE_TEST_SUITE_P(Loading, Caller, testing::Values(QUILLMERE_LOADING_CALLER));
INSTANTIATE_TEST_SUITE_P(HoldingTheLibrary, Caller, testing::Values(QUILLMERE_STATIC_CALLER));
INSTANTIATE_TEST_SUITE_P(WithFunctionsOfTheSameNames, Caller,
                         testing::Values(QUILLMERE_HOST_CALLER));

// That the programs are what they are taken for.

std::string output_of(const char *program, std::vector<std::string> arguments)
{
    command tool;
    tool.program = program;
    tool.arguments = std::move(arguments);
    return run(tool).out;
}

TEST(FixedCaller, IsNotPositionIndependentAndHoldsTheVariablesItself)
{
    EXPECT_THAT(output_of("readelf", {"--file-header", QUILLMERE_FIXED_CALLER}),
                HasSubstr("EXEC (Executable file)"));
    EXPECT_THAT(output_of("nm", {"-D", "--defined-only", "--format=posix", QUILLMERE_FIXED_CALLER}),
                testing::ContainsRegex("(^|\n)urls "));
}

TEST(PieCaller, IsPositionIndependent)
{
    EXPECT_THAT(output_of("readelf", {"--file-header", QUILLMERE_PIE_CALLER}), HasSubstr("DYN ("));
}

TEST(LoadingCaller, IsNotLinkedToTheLibrary)
{
    EXPECT_THAT(output_of("readelf", {"--dynamic", QUILLMERE_LOADING_CALLER}),
                testing::Not(HasSubstr("libquillmere")));
}

TEST(StaticCaller, NeedsNoSharedLibrary)
{
    EXPECT_THAT(output_of("readelf", {"--dynamic", QUILLMERE_STATIC_CALLER}),
                testing::Not(HasSubstr("libquillmere")));
}

TEST(HostCaller, OffersItsOwnFunctionsToEveryLibrary)
{
    EXPECT_THAT(output_of("nm", {"-D", "--defined-only", "--format=posix", QUILLMERE_HOST_CALLER}),
                testing::ContainsRegex("(^|\n)string_new T "));
}

} // namespace
} // namespace quillmere_test
