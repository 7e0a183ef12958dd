// Where the library leaves the secrets that it is trusted with, in every operation and in all that
// can become of one. The log shows a session token in the line of the request's address, where an
// operation has that line; everything else is shown nowhere.
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "api/account_operations.h"
#include "api/operations.h"
#include "support/library_fixture.h"
#include "support/stdout_capture.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;
using testing::Not;

constexpr const char *secret_email = "canary@example.com";
constexpr const char *application_key = "Canary5Ak+key";

struct secret_call {
    std::string name;
    std::function<void()> call;
    std::vector<std::string> secrets; // as they are sent
    const char *url_heading;          // of the line that may show them; null: none may
};

std::string signature_of(const std::string &credentials)
{
    const std::string signed_text = credentials + "42" + application_key;
    char digest[41] = {};
    simple_sha1(signed_text.data(), signed_text.size(), digest, sizeof digest);
    return digest;
}

void get_session(const char *password, const char *facebook_token)
{
    char *token = nullptr;
    get_session_token(secret_email, password, facebook_token, "42", application_key, &token);
    api_free(token);
}

void get_login()
{
    pkey_slot pkey;
    char *token = nullptr;
    if (get_login_token(secret_email, "Canary5Pw", "42", application_key, pkey.place(), &token) !=
        QM_MALFORMED_REPLY)
        pkey.take();
    api_free(token);
}

void update()
{
    char *message = nullptr;
    update_file("Canary5St", "key", "name", nullptr, nullptr, nullptr, nullptr, &message);
    api_free(message);
}

// An upload connection prints to standard output, whatever the log is.
void upload()
{
    char *url = get_upload_url("Canary5St", nullptr, 0);
    send_file *connection = nullptr;
    if (send_file_new(&connection, url, 0, 10) == 0) {
        const std::string request = "POST " + std::string(url) + " HTTP/1.1\r\n\r\n";
        send_file_write(connection, request.data(), request.size());
        char byte = 0;
        while (send_file_read(connection, &byte, 1) == 1)
            continue;
    }
    send_file_delete(&connection);
    api_free(url);
}

const std::string with_session = "session_token=";

std::vector<secret_call> secret_calls()
{
    std::vector<secret_call> calls = {
        {"get_session_token by password",
         [] { get_session("Canary5Pw", nullptr); },
         {"Canary5Pw", signature_of(secret_email + std::string("Canary5Pw"))},
         nullptr},
        {"get_session_token by Facebook",
         [] { get_session(nullptr, "Canary5Fb"); },
         {"Canary5Fb", signature_of("Canary5Fb")},
         nullptr},
        {"get_login_token",
         get_login,
         {"Canary5Pw", signature_of(secret_email + std::string("Canary5Pw"))},
         nullptr},
        {"update_file", update, {"Canary5St"}, "Api url:\n"},
        {"an upload connection", upload, {"Canary5St"}, nullptr},
    };
    for (const operation &each : operations)
        if (std::string(each.query).find(with_session) != std::string::npos)
            calls.push_back({each.name,
                             [&each] { each.perform(); },
                             {with_session + "session+token"},
                             each.url_heading});
    for (const account_operation &each : account_operations)
        calls.push_back(
            {each.name, [&each] { each.call(); }, {with_session + "token"}, each.url_heading});
    return calls;
}

struct trouble {
    const char *name;
    connection_script script;
};

connection_script sending(const std::string &bytes)
{
    return [bytes](connection &client) {
        client.read_request();
        client.send(bytes);
    };
}

std::vector<trouble> troubles()
{
    const std::string body = "<response><result>Success</result><error>105</error></response>";
    const std::string reply = xml_reply(body);
    return {
        {"None", sending(reply)},
        {"Refusal", sending(http_reply(403, refusing_reply("<error>105</error>")))},
        {"NoResult", sending(xml_reply("<response/>"))},
        {"Damage", sending(xml_reply(body.substr(0, body.size() - 5)))},
        {"EarlyEnd", sending(reply.substr(0, reply.size() - 5))},
        {"Reset", resetting()},
        {"NoReply", closing()},
        {"EmptyReply", sending(http_reply(500, ""))},
        {"NotHttp", sending("nothing of the kind")},
        {"Redirect", sending(http_reply(302, "", {"Location: /elsewhere"}))},
        {"RedirectToAnotherProtocol", sending(http_reply(302, "", {"Location: ftp://h/"}))},
        {"RedirectToNowhere", sending(http_reply(302, "", {"Location: http://[/"}))},
        {"TooMuch", sending(http_reply(200, std::string(100'000, 'x')))},
    };
}

void PrintTo(const trouble &each, std::ostream *out) { *out << each.name; }

class Secrets : public library_test {
protected:
    void expect_hidden(const secret_call &tested)
    {
        SCOPED_TRACE(tested.name);
        const std::string shown = shown_by(tested);
        for (const std::string &secret : tested.secrets)
            EXPECT_THAT(shown, Not(HasSubstr(secret)));
        EXPECT_THAT(shown, Not(HasSubstr("Canary5Ak")));
    }

    void play(const connection_script &script)
    {
        server.script(script);
        plain_server.script(script);
    }

private:
    // What a call logs and prints, but for the address that it has to show.
    std::string shown_by(const secret_call &tested)
    {
        log.clear();
        const stdout_capture output;
        tested.call();
        std::string text = log.text();
        if (tested.url_heading) {
            const size_t address = text.find(tested.url_heading) + std::strlen(tested.url_heading);
            text.erase(address, text.find('\n', address) - address);
        }
        return text + output.text();
    }
};

class SecretsInTrouble : public Secrets, public testing::WithParamInterface<trouble> {};

INSTANTIATE_TEST_SUITE_P(All, SecretsInTrouble, testing::ValuesIn(troubles()),
                         [](const auto &tested) { return std::string(tested.param.name); });

TEST_P(SecretsInTrouble, AreShownNowhereElse)
{
    set_response_limit(10'000);
    for (const secret_call &tested : secret_calls()) {
        play(GetParam().script);
        expect_hidden(tested);
    }
}

TEST_F(Secrets, AreShownNowhereElseWhenNobodyListens)
{
    const refused_port nobody;
    point_at(nobody.base_url());
    const std::string base = nobody.base_url();
    urls[0] = urls[2] = base.c_str();
    for (const secret_call &tested : secret_calls())
        expect_hidden(tested);
}

class SecretsWithoutTrust : public Secrets {
protected:
    scripted_server unknown{tls_with(certificate_of_unknown_root())};
};

TEST_F(SecretsWithoutTrust, AreShownNowhereElse)
{
    point_at(unknown);
    for (const secret_call &tested : secret_calls())
        expect_hidden(tested);
    EXPECT_EQ(unknown.requests().size(), 0U);
}

// All that is looked for above has been there to be found.
TEST_F(Secrets, AreSent)
{
    play(sending(xml_reply("<response><result>Success</result></response>")));
    for (const secret_call &tested : secret_calls()) {
        const size_t before = plain_server.requests().size();

        tested.call();

        const std::vector<request> sent =
            (plain_server.requests().size() > before ? plain_server : server).requests();
        for (const std::string &secret : tested.secrets)
            EXPECT_THAT(sent.back().target, HasSubstr(secret)) << tested.name;
    }
}

} // namespace
} // namespace quillmere_test
