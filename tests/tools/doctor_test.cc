// What the doctor finds on the way to a service that is well, and to ones that are not.
#include "doctor/examination.h"

#include <ctime>

#include <curl/curl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "support/certificates.h"
#include "support/scripted_server.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using nlohmann::json;
using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::Not;

std::string http_date(std::time_t when)
{
    char text[64];
    std::tm parts = {};
    ::gmtime_r(&when, &parts);
    std::strftime(text, sizeof text, "Date: %a, %d %b %Y %H:%M:%S GMT", &parts);
    return text;
}

std::string status_reply(const header_lines &fields = {})
{
    return http_reply(200,
                      "<response><result>Success</result><database>live</database>"
                      "<memcache>none</memcache></response>",
                      fields);
}

class Doctor : public testing::Test {
protected:
    Doctor() { home.environment["SSL_CERT_FILE"] = test_root_path(); }

    /** What is found of a service, step by step. */
    json found(const std::string &service, int exit_code, std::vector<std::string> more = {}) const
    {
        more.insert(more.begin(), {"doctor", "--json", "--service", service});
        const outcome ended = home.run(more);
        EXPECT_EQ(ended.exit_status, exit_code) << ended.out << ended.err;
        EXPECT_THAT(ended.err, IsEmpty());
        json document = json::parse(ended.out, nullptr, false);
        EXPECT_EQ(document.value("healthy", exit_code != 0), exit_code == 0);
        return document.value("steps", json::array());
    }

    static json step(const json &steps, const std::string &name)
    {
        for (const json &each : steps)
            if (each.at("step") == name)
                return each;
        ADD_FAILURE() << "there is no step " << name << " in " << steps;
        return json{{"step", name}, {"result", ""}, {"detail", ""}, {"advice", ""}};
    }

    static std::string results_of(const json &steps)
    {
        std::string text;
        for (const json &each : steps)
            text += (text.empty() ? "" : " ") + each.at("step").get<std::string>() + ":" +
                    each.at("result").get<std::string>();
        return text;
    }

    program_home home;
};

TEST_F(Doctor, FindsNothingWrongWithAServiceThatIsWell)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(status_reply({http_date(std::time(nullptr))}));

    const json steps = found(server.base_url(), 0);

    EXPECT_EQ(results_of(steps),
              "versions:ok service:ok ca:ok proxy:ok session:ok dns:ok connect:ok tls:ok answer:ok "
              "clock:ok api:ok");
    EXPECT_THAT(step(steps, "versions").at("detail"),
                MatchesRegex("quillmere [0-9.]+, libcurl [^,]+, OpenSSL/[^,]+, expat_[0-9.]+"));
    EXPECT_THAT(
        step(steps, "ca").at("detail"),
        AllOf(HasSubstr(test_root_path()), HasSubstr("SSL_CERT_FILE"), HasSubstr("1 certificate")));
    EXPECT_THAT(step(steps, "connect").at("detail"), HasSubstr("127.0.0.1"));
    EXPECT_THAT(step(steps, "api").at("detail"), HasSubstr("live"));
    for (const char *timed : {"dns", "connect", "tls", "answer", "api"})
        EXPECT_TRUE(step(steps, timed).at("milliseconds").is_number()) << timed;
    EXPECT_EQ(server.requests().at(0).method, "HEAD");
}

TEST_F(Doctor, TellsPeopleALineForEachStep)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(status_reply());
    home.environment["QUILLMERE_SERVICE"] = server.base_url();

    const outcome ended = home.run({"doctor"});

    EXPECT_EQ(ended.exit_status, 0);
    EXPECT_THAT(ended.out, HasSubstr("\nok       service"));
    EXPECT_THAT(ended.out, HasSubstr("\nskipped  clock"));
    EXPECT_THAT(home.run({"doctor", "--color", "always"}).out, HasSubstr("\x1b[32mok\x1b[0m  "));
}

TEST_F(Doctor, TellsWhatIsWrongWithACertificate)
{
    struct wrong {
        certificate leaf;
        const char *problem;
    };
    const wrong all[] = {{expired_certificate(), "expired"},
                         {not_yet_valid_certificate(), "not yet valid"},
                         {certificate_for_another_host(), "127.0.0.1"},
                         {certificate_of_unknown_root(), "issuer"},
                         {self_signed_certificate(), "self-signed"}};
    for (const wrong &each : all) {
        scripted_server server(tls_with(each.leaf));
        server.answer(status_reply());

        const json steps = found(server.base_url(), 5);

        EXPECT_EQ(results_of(steps),
                  "versions:ok service:ok ca:ok proxy:ok session:ok dns:ok connect:ok tls:failed "
                  "answer:skipped clock:skipped api:skipped");
        EXPECT_THAT(
            step(steps, "tls").at("detail"),
            AllOf(HasSubstr(each.problem), HasSubstr("certificate of "), HasSubstr("good until ")));
        EXPECT_THAT(step(steps, "tls").at("advice"), HasSubstr("--ca-file"));
        EXPECT_THAT(server.requests(), IsEmpty()) << "nothing is asked of whom nobody knows";
    }
}

TEST_F(Doctor, TellsThatNobodyListens)
{
    const refused_port closed;

    const json steps = found(closed.base_url("https"), 5);

    EXPECT_EQ(step(steps, "dns").at("result"), "ok");
    EXPECT_EQ(step(steps, "connect").at("result"), "failed");
    EXPECT_THAT(step(steps, "connect").at("advice"), HasSubstr("check the address"));
    EXPECT_TRUE(step(steps, "connect").at("milliseconds").is_null());
    EXPECT_EQ(step(steps, "tls").at("result"), "skipped");
}

TEST_F(Doctor, TellsThatAServiceSpeaksNoTls)
{
    scripted_server server;
    server.script([](connection &client) {
        client.send("HTTP/1.1 400 Bad Request\r\n\r\n"); // to a greeting that it does not know
        client.wait_for_peer_close();
    });
    std::string address = server.base_url();
    address.replace(0, 4, "https");

    const json steps = found(address, 5);

    EXPECT_EQ(step(steps, "connect").at("result"), "ok");
    EXPECT_EQ(step(steps, "tls").at("result"), "failed");
    EXPECT_THAT(step(steps, "tls").at("advice"), HasSubstr("HTTPS"));
}

TEST_F(Doctor, TellsThatAnAnswerIsMissing)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.script(closing());

    const json steps = found(server.base_url(), 5);

    EXPECT_EQ(step(steps, "tls").at("result"), "ok");
    EXPECT_EQ(step(steps, "answer").at("result"), "failed");
    EXPECT_EQ(step(steps, "clock").at("result"), "skipped");
}

TEST_F(Doctor, TellsThatAClockIsWrong)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(status_reply({http_date(std::time(nullptr) + 7200)}));

    const json steps = found(server.base_url(), 1);

    EXPECT_EQ(step(steps, "clock").at("result"), "failed");
    EXPECT_THAT(step(steps, "clock").at("detail"), MatchesRegex("7[12]..? s behind the service's"));
    EXPECT_EQ(step(steps, "api").at("result"), "ok");
}

TEST_F(Doctor, TellsThatTheAnswerIsNoReply)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(http_reply(200, "<html>Sign in to the network</html>"));

    const json steps = found(server.base_url(), 6);

    EXPECT_EQ(step(steps, "answer").at("result"), "ok");
    EXPECT_EQ(step(steps, "api").at("result"), "failed");
    EXPECT_THAT(step(steps, "api").at("detail"), HasSubstr("HTML page"));
}

TEST_F(Doctor, TellsThatTheSettingsCannotBe)
{
    const json steps =
        found("https://127.0.0.1:1", 9, {"--ca-file", home.folder().path_of("absent")});

    EXPECT_EQ(results_of(steps), "versions:ok settings:failed");
    EXPECT_THAT(step(steps, "settings").at("detail"), HasSubstr("absent"));
}

TEST_F(Doctor, ShowsNoPasswordOfAProxy)
{
    const refused_port closed;
    std::string proxy = closed.base_url();
    proxy.insert(proxy.find("//") + 2, "someone:hunter2@");
    home.environment["https_proxy"] = proxy;
    home.environment["no_proxy"] = "internal.example";

    const outcome ended = home.run({"doctor", "--service", "https://service.example"});

    EXPECT_EQ(ended.exit_status, 5);
    EXPECT_THAT(ended.out + ended.err, Not(HasSubstr("hunter2")));
    EXPECT_THAT(ended.out, AllOf(HasSubstr("http://(masked)@127.0.0.1:"),
                                 HasSubstr("https_proxy, but not for internal.example")));
}

TEST_F(Doctor, ShowsWhoIsSignedInAndNoToken)
{
    scripted_server server(tls_with(loopback_certificate()));
    server.answer(status_reply());
    home.sign_in(server.base_url(), "token-that-nobody-may-see");

    const json steps = found(server.base_url(), 0);

    EXPECT_EQ(step(steps, "session").at("detail"), "signed in as someone@example.org");
    EXPECT_THAT(steps.dump(), Not(HasSubstr("token-that-nobody-may-see")));
}

TEST(Diagnosis, OfANameThatIsNotKnownSkipsTheRest)
{
    settings chosen;
    chosen.addresses = addresses_of("https://nowhere.example", "https://nowhere.example");
    connection_probe probe;
    probe.reached = stage::lookup;
    probe.code = CURLE_COULDNT_RESOLVE_HOST;
    probe.problem = "Could not resolve host: nowhere.example";
    examination steps;

    add_connection_steps(probe, chosen, steps);

    ASSERT_EQ(steps.size(), 5U);
    EXPECT_STREQ(steps[0].name, "dns");
    EXPECT_EQ(steps[0].result, finding::failed);
    EXPECT_EQ(steps[0].detail, probe.problem);
    EXPECT_EQ(steps[0].advice, "check the address, and whether this machine is connected");
    for (std::size_t i = 1; i < steps.size(); ++i)
        EXPECT_EQ(steps[i].result, finding::skipped) << steps[i].name;
}

TEST(Diagnosis, OfAConnectionThatTakesTooLongSuspectsAFirewall)
{
    settings chosen;
    chosen.addresses = addresses_of("https://far.example", "https://far.example");
    connection_probe probe;
    probe.reached = stage::connection;
    probe.code = CURLE_OPERATION_TIMEDOUT;
    probe.ended[0] = std::chrono::microseconds(1500);
    examination steps;

    add_connection_steps(probe, chosen, steps);

    EXPECT_EQ(steps[0].result, finding::ok);
    EXPECT_EQ(steps[0].time, std::chrono::microseconds(1500));
    EXPECT_EQ(steps[1].result, finding::failed);
    EXPECT_THAT(steps[1].advice, HasSubstr("firewall"));
}

TEST(Credentials, AreTakenOutOfAnAddress)
{
    EXPECT_EQ(without_credentials("http://a:b@host:1"), "http://(masked)@host:1");
    EXPECT_EQ(without_credentials("a:p@ss@host"), "(masked)@host");
    EXPECT_EQ(without_credentials("http://host:1"), "http://host:1");
}

} // namespace
} // namespace quillmere_test
