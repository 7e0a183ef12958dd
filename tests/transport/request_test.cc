// A request object's life, the exchange that it makes, and the verdict on the reply.
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "text/buffer.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

constexpr const char *unreadable_error = "Error parsing XML when trying to get error text";

std::string unusable(int code)
{
    return "Response error: received server HTTP response code " + std::to_string(code);
}

struct request_deleter {
    void operator()(api_request *request) const { api_request_delete(&request); }
};
using owned_request = std::unique_ptr<api_request, request_deleter>;

struct called {
    int32_t status;
    std::optional<std::string> message;
};

// message starts as the caller leaves it, NULL if nothing is said.
called call(const owned_request &request)
{
    char *message = nullptr;
    int32_t status = make_api_call(request.get(), &message);
    called result = {status, message ? std::optional<std::string>(message) : std::nullopt};
    api_free(message);
    return result;
}

TEST(Request, IsEmptyAtFirst)
{
    owned_request request(api_request_new());

    EXPECT_EQ(request->url, nullptr);
    EXPECT_EQ(request->post_data, nullptr);
    EXPECT_EQ(request->response, nullptr);
    EXPECT_EQ(request->response_length, 0u);
    EXPECT_EQ(request->timeout, 0);
    EXPECT_EQ(request->verbose, 1);
}

TEST(Request, IsDeletedWithAllThatItHolds)
{
    api_request *request = api_request_new();
    request->url = buffer_of("a url").release();
    string_append_obfs(request->url, "secret");
    string_get_obfs(request->url, nullptr);
    request->post_data = buffer_of("a body").release();
    request->response = string_dup("a response");
    api_request *before = request;

    api_request_delete(&request); // a leak checker sees to the rest

    EXPECT_EQ(request, before);
}

TEST(Request, MayBeNoneWhenItIsDeleted)
{
    api_request *none = nullptr;

    api_request_delete(&none);
    api_request_delete(nullptr);

    EXPECT_EQ(none, nullptr);
}

class ApiCall : public library_test {
protected:
    ApiCall() { request->url = api_url_new_https("/api/some/thing.php"); }

    std::string url() const { return server.base_url() + "/api/some/thing.php?"; }

    called call_answered_by(const std::string &reply)
    {
        server.answer(reply);
        return call(request);
    }

    std::string log_of(const std::optional<std::string> &response) const
    {
        return "Api url:\n" + url() + "\nGot text:\n" + response.value_or("(null)") + "\n";
    }

    // What one lookup says of a document that is not well-formed.
    static std::string damage_log(const std::string &sought, const std::string &document)
    {
        return "Expat failed parsing a node with error 0\n"
               "Name of node whose value is sought: " +
               sought + "\nXML we are searching for this node:\n" + document + "\n";
    }

    void expect_hook_call(const std::string &response, int32_t status,
                          const std::optional<std::string> &message)
    {
        ASSERT_EQ(hook.calls().size(), 1u);
        EXPECT_EQ(hook.calls()[0].url, url());
        EXPECT_EQ(hook.calls()[0].response, response);
        EXPECT_EQ(hook.calls()[0].status, status);
        EXPECT_EQ(hook.calls()[0].message, message);
    }

    hook_recorder hook;
    owned_request request{api_request_new()};
};

TEST_F(ApiCall, SucceedsWithOneGetOfItsUrl)
{
    called result = call_answered_by(xml_reply(success));

    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.message, std::nullopt);
    ASSERT_EQ(server.requests().size(), 1u);
    EXPECT_EQ(server.requests()[0].method, "GET");
    EXPECT_EQ(server.requests()[0].target, "/api/some/thing.php?");
    EXPECT_EQ(server.requests()[0].body, "");
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(log.text(), log_of(success));
}

TEST_F(ApiCall, KeepsTheResponseWithItsLength)
{
    call_answered_by(xml_reply(success));

    EXPECT_STREQ(request->response, success);
    EXPECT_EQ(request->response_length, std::string(success).size());
}

TEST_F(ApiCall, LeavesTheMessageOfASuccessAlone)
{
    char before[] = "before";
    char *message = before;
    server.answer(xml_reply(success));

    EXPECT_EQ(make_api_call(request.get(), &message), 0);

    EXPECT_EQ(message, before);
}

TEST_F(ApiCall, SendsASensitiveValueThatItDoesNotLog)
{
    url_add_required_sensitive_parameter(request->url, "secret", "a b");
    url_add_required_parameter(request->url, "open", "c d");

    call_answered_by(xml_reply(success));

    EXPECT_EQ(server.requests().at(0).target, "/api/some/thing.php?&secret=a%20b&open=c%20d");
    EXPECT_EQ(log.text(),
              "Api url:\n" + url() + "&secret=(omitted)&open=c%20d\nGot text:\n" + success + "\n");
}

TEST_F(ApiCall, PostsItsBodyByteForByte)
{
    const std::string body("a=\0&%\r\n\xff", 8);
    request->post_data = buffer_of(body).release();

    called result = call_answered_by(xml_reply(success));

    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(server.requests().at(0).method, "POST");
    EXPECT_EQ(server.requests().at(0).body, body);
    EXPECT_EQ(log.text(), log_of(success));
}

TEST_F(ApiCall, GetsWithABodyThatIsEmpty)
{
    request->post_data = string_new(0);

    EXPECT_EQ(call_answered_by(xml_reply(success)).status, 0);
    EXPECT_EQ(server.requests().at(0).method, "GET");
}

TEST_F(ApiCall, GoesToThePlainBaseAddressIfItsUrlDoes)
{
    string_delete(request->url, 1);
    request->url = api_url_new_http("/api/some/thing.php");
    plain_server.answer(xml_reply(success));

    EXPECT_EQ(call(request).status, 0);
    EXPECT_EQ(plain_server.requests().at(0).target, "/api/some/thing.php?");
    EXPECT_EQ(server.connections(), 0u);
}

TEST_F(ApiCall, IsARefusalWithTheServicesNumberAndMessage)
{
    const std::string refusal = "<response><message>No such file</message><error>114</error>"
                                "<result>Error</result></response>";

    called result = call_answered_by(xml_reply(refusal));

    EXPECT_EQ(result.status, 114);
    EXPECT_EQ(result.message, "No such file");
    expect_hook_call(refusal, 114, "No such file");
    EXPECT_EQ(log.text(), log_of(refusal));
}

TEST_F(ApiCall, TellsTheHookTheUrlUnredacted)
{
    url_add_required_sensitive_parameter(request->url, "secret", "a b");

    call_answered_by(xml_reply("<response><result>Error</result></response>"));

    ASSERT_EQ(hook.calls().size(), 1u);
    EXPECT_EQ(hook.calls()[0].url, url() + "&secret=a%20b");
}

TEST_F(ApiCall, DoesWithoutAHook)
{
    check_api_error = nullptr;

    called result =
        call_answered_by(xml_reply("<response><result>Error</result><error>3</error></response>"));

    EXPECT_EQ(result.status, 3);
    EXPECT_TRUE(hook.calls().empty());
}

TEST_F(ApiCall, IsJudgedByTheReplyWhateverTheHttpStatus)
{
    EXPECT_EQ(call_answered_by(http_reply(500, success)).status, 0);
}

struct refusal_case {
    const char *name;
    const char *inside; // the response, besides the result
    int32_t status;
    std::optional<std::string> message;
};

void PrintTo(const refusal_case &each, std::ostream *out) { *out << each.name; }

class RefusedApiCall : public ApiCall, public testing::WithParamInterface<refusal_case> {};

TEST_P(RefusedApiCall, HasItsStatusAndMessage)
{
    const std::string reply =
        std::string("<response><result>Error</result>") + GetParam().inside + "</response>";

    called result = call_answered_by(xml_reply(reply));

    EXPECT_EQ(result.status, GetParam().status);
    EXPECT_EQ(result.message, GetParam().message);
    expect_hook_call(reply, GetParam().status, GetParam().message);
}

const refusal_case refusals[] = {
    {"number and message", "<error>105</error><message>m</message>", 105, "m"},
    {"number alone", "<error>105</error>", 105, std::nullopt},
    {"message alone", "<message>m</message>", QM_UNUSABLE_ERROR_NUMBER, "m"},
    {"neither", "", QM_UNUSABLE_ERROR_NUMBER, std::nullopt},
    {"number 0", "<error>0</error><message>m</message>", QM_UNUSABLE_ERROR_NUMBER, "m"},
    {"no number", "<error>abc</error><message>m</message>", QM_UNUSABLE_ERROR_NUMBER, "m"},
    {"empty", "<error/><message/>", QM_UNUSABLE_ERROR_NUMBER, std::nullopt},
    {"deeper", "<a><error>105</error><message>m</message></a>", QM_UNUSABLE_ERROR_NUMBER,
     std::nullopt},
};
INSTANTIATE_TEST_SUITE_P(All, RefusedApiCall, testing::ValuesIn(refusals));

class NearlySuccessfulApiCall : public ApiCall, public testing::WithParamInterface<const char *> {};

TEST_P(NearlySuccessfulApiCall, IsARefusal)
{
    std::string reply = std::string("<response><result>") + GetParam() + "</result></response>";

    EXPECT_EQ(call_answered_by(xml_reply(reply)).status, QM_UNUSABLE_ERROR_NUMBER);
    EXPECT_EQ(hook.calls().size(), 1u);
}

INSTANTIATE_TEST_SUITE_P(Results, NearlySuccessfulApiCall,
                         testing::Values("success", "SUCCESS", "Succes", "Success ", " Success",
                                         "Successs", "0"));

struct unusable_case {
    const char *name;
    int http_status;
    std::string body;
};

void PrintTo(const unusable_case &each, std::ostream *out) { *out << each.name; }

class UnusableReply : public ApiCall, public testing::WithParamInterface<unusable_case> {};

TEST_P(UnusableReply, FailsWithItsHttpStatusInTheMessage)
{
    const auto &[name, http_status, body] = GetParam();

    called result = call_answered_by(http_reply(http_status, body));

    EXPECT_EQ(result.status, QM_UNUSABLE_RESPONSE);
    EXPECT_EQ(result.message, unusable(http_status));
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(log.text(), log_of(body.empty() ? std::nullopt : std::optional(body)));
}

const unusable_case unusable_replies[] = {
    {"a page", 500, "<html><body>Sorry</body></html>"},
    {"a page without an error", 200, "<html/>"},
    {"a page of another number", 404, "<html><body>Not found</body></html>"},
    {"an envelope with an error, but no result", 200,
     "<response><error>114</error><message>m</message></response>"},
    {"an envelope with an empty result", 200, "<response><result/><error>1</error></response>"},
    {"nothing", 200, ""},
    {"nothing with an error", 503, ""},
};
INSTANTIATE_TEST_SUITE_P(All, UnusableReply, testing::ValuesIn(unusable_replies));

TEST_F(ApiCall, IsMalformedIfAPageIsNoDocument)
{
    const std::string page = "<html><body>Sorry<br></body></html>";

    called result = call_answered_by(http_reply(500, page));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, unusable(500)); // stored before the damage overrode the status
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(log.text(), log_of(page) + damage_log("result", page));
}

TEST_F(ApiCall, IsMalformedIfASuccessIsCutOff)
{
    const std::string cut = "<response><result>Success</result>";

    called result = call_answered_by(xml_reply(cut));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, std::nullopt);
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(log.text(), log_of(cut) + damage_log("result", cut));
}

TEST_F(ApiCall, IsMalformedWithoutANumberIfARefusalIsCutOff)
{
    const std::string cut = "<response><result>Error</result>";

    called result = call_answered_by(xml_reply(cut));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, unreadable_error);
    expect_hook_call(cut, QM_MALFORMED_REPLY, unreadable_error);
    EXPECT_EQ(log.text(), log_of(cut) + damage_log("result", cut) + damage_log("/error", cut));
}

TEST_F(ApiCall, IsMalformedEvenWithANumberIfARefusalIsCutOff)
{
    const std::string cut = "<response><result>Error</result><error>114</error>";

    called result = call_answered_by(xml_reply(cut));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, unreadable_error);
    expect_hook_call(cut, 114, unreadable_error);
}

TEST_F(ApiCall, FailsWithoutAnAnswer)
{
    server.script(closing());

    called result = call(request);

    EXPECT_EQ(result.status, QM_NO_RESPONSE);
    EXPECT_EQ(result.message, no_code);
    EXPECT_EQ(request->response, nullptr);
    EXPECT_EQ(request->response_length, 0u);
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_THAT(log.text(), MatchesRegex(literally("Api url:\n" + url() + "\n") + any_failure_line +
                                         literally("Got text:\n(null)\n")));
}

TEST_F(ApiCall, TriesAsOftenAsIsAllowed)
{
    set_connection_attempts(3);
    server.next({resetting(), resetting(), answering(xml_reply(success))});

    EXPECT_EQ(call(request).status, 0);
    EXPECT_EQ(server.connections(), 3u);
}

// A local file is read, but says nothing of a code.
TEST_F(ApiCall, FailsWithAReplyThatCameWithoutACode)
{
    temporary_folder folder;
    const std::string path = folder.write("a-name-of-some-length", "<response/>");
    string_delete(request->url, 1);
    request->url = buffer_of("file://" + path).release();

    called result = call(request);

    EXPECT_EQ(result.status, QM_NO_RESPONSE);
    EXPECT_EQ(result.message, no_code);
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(log.text(), "Api url:\nfile://" + path + "\nGot text:\n<response/>\n");
}

TEST_F(ApiCall, FailsWithoutAUrl)
{
    string_delete(std::exchange(request->url, nullptr), 1);

    called result = call(request);

    EXPECT_EQ(result.status, QM_NO_RESPONSE);
    EXPECT_EQ(result.message, no_code);
    EXPECT_EQ(log.text(), "Api url:\n(null)\nGot text:\n(null)\n");
}

TEST_F(ApiCall, FailsWithAUrlThatIsTooShort)
{
    string_delete(request->url, 1);
    request->url = buffer_of("http://localhost/").release();

    EXPECT_EQ(call(request).status, QM_NO_RESPONSE);
    EXPECT_EQ(log.text(), "Api url:\nhttp://localhost/\nGot text:\n(null)\n");
}

TEST_F(ApiCall, LogsNothingUnlessItIsVerbose)
{
    request->verbose = 0;

    EXPECT_EQ(call_answered_by(xml_reply(success)).status, 0);
    EXPECT_EQ(log.text(), "");
}

TEST_F(ApiCall, LeavesOutItsOwnLinesAloneUnlessItIsVerbose)
{
    request->verbose = 0;
    server.script(closing());

    EXPECT_EQ(call(request).status, QM_NO_RESPONSE);
    EXPECT_THAT(log.text(), MatchesRegex(any_failure_line));
}

TEST_F(ApiCall, IsVerboseWithAnyFlagButZero)
{
    request->verbose = -1;

    call_answered_by(xml_reply(success));

    EXPECT_EQ(log.text(), log_of(success));
}

TEST_F(ApiCall, MayBeMadeAgain)
{
    call_answered_by(xml_reply("<response><result>Error</result><error>3</error></response>"));

    called result = call_answered_by(xml_reply(success));

    EXPECT_EQ(result.status, 0);
    EXPECT_STREQ(request->response, success);
}

TEST_F(ApiCall, KeepsNoEarlierResponseWhenItFails)
{
    call_answered_by(xml_reply(success));
    server.script(closing());

    EXPECT_EQ(call(request).status, QM_NO_RESPONSE);
    EXPECT_EQ(request->response, nullptr);
    EXPECT_EQ(request->response_length, 0u);
}

} // namespace
} // namespace quillmere_test
