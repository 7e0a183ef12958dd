// What all operations have in common: one request, one verdict on the reply, and what is logged.
#include <gmock/gmock.h>

#include "api/account_operations.h"
#include "api/operations.h"
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

constexpr const char *unreadable_error = "Error parsing XML when trying to get error text";

std::string unusable(int code)
{
    return "Response error: received server HTTP response code " + std::to_string(code);
}

class Operation : public library_test, public testing::WithParamInterface<operation> {
protected:
    performed perform_with(const std::string &reply)
    {
        server.answer(reply);
        return GetParam().perform();
    }

    // Some operations leave failed exchanges without a message.
    void expect_failed_exchange(const performed &result, int32_t status, const std::string &message)
    {
        EXPECT_EQ(result.status, status);
        EXPECT_FALSE(result.handed_out);
        EXPECT_EQ(result.message,
                  GetParam().explains_failed_exchange ? std::optional(message) : std::nullopt);
        EXPECT_TRUE(hook.calls().empty());
    }

    // What the hook must have been told, once.
    void expect_hook_call(const std::string &response, int32_t status,
                          const std::optional<std::string> &message)
    {
        ASSERT_EQ(hook.calls().size(), 1u);
        hook_call call = hook.calls()[0];
        EXPECT_EQ(call.url, server.base_url() + GetParam().target());
        EXPECT_EQ(call.response, response);
        EXPECT_EQ(call.status, status);
        EXPECT_EQ(call.message, message);
    }

    hook_recorder hook;
};

INSTANTIATE_TEST_SUITE_P(All, Operation, testing::ValuesIn(operations));

TEST_P(Operation, SendsOneGetOfItsTarget)
{
    performed result = perform_with(xml_reply(GetParam().success()));

    EXPECT_EQ(result.status, 0);
    EXPECT_TRUE(result.handed_out);
    EXPECT_EQ(result.message, std::nullopt);
    ASSERT_EQ(server.requests().size(), 1u);
    EXPECT_EQ(server.requests()[0].method, "GET");
    EXPECT_EQ(server.requests()[0].target, GetParam().target());
    EXPECT_EQ(server.requests()[0].body, "");
    EXPECT_TRUE(hook.calls().empty());
}

TEST_P(Operation, LogsItsUrlAndTheReply)
{
    perform_with(xml_reply(GetParam().success()));

    EXPECT_EQ(log.text(), GetParam().whole_log(GetParam().success()));
}

TEST_P(Operation, ReadsItsPathAtEveryCall)
{
    *GetParam().path = "/another/path.php";

    performed result = perform_with(xml_reply(GetParam().success()));

    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(server.requests().at(0).path(), "/another/path.php");
}

TEST_P(Operation, ReadsTheBaseAddressAtEveryCall)
{
    point_at(plain_server);
    plain_server.answer(xml_reply(GetParam().success()));

    EXPECT_EQ(GetParam().perform().status, 0);
    EXPECT_EQ(plain_server.requests().size(), 1u);
}

TEST_P(Operation, ReadsTheVersionAtEveryCall)
{
    api_version = "1.5&x";

    perform_with(xml_reply(GetParam().success()));

    bool sends_version = GetParam().target().find("version=") != std::string::npos;
    EXPECT_EQ(server.requests().at(0).parameter("version"),
              sends_version ? std::optional<std::string>("1.5") : std::nullopt);
}

TEST_P(Operation, TriesAsOftenAsIsAllowed)
{
    set_connection_attempts(3);
    server.next({resetting(), resetting(), answering(xml_reply(GetParam().success()))});

    EXPECT_EQ(GetParam().perform().status, 0);
    EXPECT_EQ(server.connections(), 3u);
}

TEST_P(Operation, JudgesTheReplyWhateverItsHttpStatus)
{
    performed result = perform_with(http_reply(503, GetParam().success()));

    EXPECT_EQ(result.status, 0);
    EXPECT_TRUE(result.handed_out);
}

TEST_P(Operation, FailsWithoutAnAnswer)
{
    server.script(closing());

    performed result = GetParam().perform();

    // A login counts the missing code as one, deliberately.
    bool login = GetParam().path == &get_login_token_uri;
    expect_failed_exchange(result, login ? QM_UNUSABLE_RESPONSE : QM_NO_RESPONSE, no_code);
    EXPECT_THAT(log.text(), MatchesRegex(literally(GetParam().url_log()) + any_failure_line +
                                         literally(GetParam().reply_log(std::nullopt))));
}

TEST_P(Operation, FailsWithAnEmptyReply)
{
    performed result = perform_with(http_reply(500, ""));

    expect_failed_exchange(result, QM_UNUSABLE_RESPONSE, unusable(500));
    EXPECT_EQ(log.text(), GetParam().url_log() + GetParam().reply_log(std::nullopt));
}

TEST_P(Operation, FailsWithAnEmptySuccessOfHttp)
{
    expect_failed_exchange(perform_with(http_reply(200, "")), QM_UNUSABLE_RESPONSE, unusable(200));
}

TEST_P(Operation, FailsWithAReplyThatHasNoResult)
{
    performed result = perform_with(http_reply(404, "<response><error>105</error></response>"));

    expect_failed_exchange(result, QM_UNUSABLE_RESPONSE, unusable(404));
}

TEST_P(Operation, FailsWithAReplyThatHasAnEmptyResult)
{
    performed result = perform_with(xml_reply("<response><result/></response>"));

    expect_failed_exchange(result, QM_UNUSABLE_RESPONSE, unusable(200));
}

// A scheme without response codes, to have a reply without one.
class WithoutResponseCodes : public Operation {
protected:
    performed perform_on_file(const std::string &content)
    {
        folder.write("reply.xml", content);
        *GetParam().path = "/reply.xml";
        point_at("file://" + folder.path());
        return GetParam().perform();
    }

    temporary_folder folder;
};

INSTANTIATE_TEST_SUITE_P(All, WithoutResponseCodes, testing::ValuesIn(operations));

TEST_P(WithoutResponseCodes, AnEmptyReplyIsNone)
{
    expect_failed_exchange(perform_on_file(""), QM_NO_RESPONSE, no_code);
}

TEST_P(WithoutResponseCodes, AReplyWithoutAResultIsNone)
{
    performed result = perform_on_file("<response/>");

    // A login has a reply, and so does not ask for its code, deliberately.
    bool login = GetParam().path == &get_login_token_uri;
    expect_failed_exchange(result, login ? QM_UNUSABLE_RESPONSE : QM_NO_RESPONSE, no_code);
}

TEST_P(WithoutResponseCodes, ASuccessIsOneAllTheSame)
{
    EXPECT_EQ(perform_on_file(GetParam().success()).status, 0);
}

struct service_error {
    const char *inside;
    int32_t status;
    std::optional<std::string> message;
};

void PrintTo(const service_error &each, std::ostream *out) { *out << each.inside; }

class RefusedOperation : public library_test,
                         public testing::WithParamInterface<std::tuple<operation, service_error>> {
};

TEST_P(RefusedOperation, HasTheServicesNumberAndMessageAndTellsTheHook)
{
    const auto &[what, error] = GetParam();
    hook_recorder hook;
    const std::string reply = refusing_reply(error.inside + std::string(what.payload));
    server.answer(http_reply(403, reply));

    performed result = what.perform();

    EXPECT_EQ(result.status, error.status);
    EXPECT_EQ(result.message, error.message);
    EXPECT_FALSE(result.handed_out);
    EXPECT_EQ(log.text(), what.whole_log(reply));
    ASSERT_EQ(hook.calls().size(), 1u);
    EXPECT_EQ(hook.calls()[0].url, server.base_url() + what.target());
    EXPECT_EQ(hook.calls()[0].response, reply);
    EXPECT_EQ(hook.calls()[0].status, error.status);
    EXPECT_EQ(hook.calls()[0].message, error.message);
}

INSTANTIATE_TEST_SUITE_P(
    All, RefusedOperation,
    testing::Combine(
        testing::ValuesIn(operations),
        testing::Values(service_error{"<error>105</error><message>No</message>", 105, "No"},
                        service_error{"<error>105</error>", 105, std::nullopt},
                        service_error{"<error>0</error><message>No</message>", -8, "No"},
                        service_error{"<error>abc</error><message>No</message>", -8, "No"},
                        service_error{"<error/>", -8, std::nullopt},
                        service_error{"<message>No</message>", -8, "No"},
                        service_error{"<error>-3</error>", -3, std::nullopt})));

class ResultThatIsNoSuccess
    : public library_test,
      public testing::WithParamInterface<std::tuple<operation, const char *>> {};

TEST_P(ResultThatIsNoSuccess, IsARefusal)
{
    const auto &[what, text] = GetParam();
    server.answer(xml_reply("<response><result>" + std::string(text) + "</result>" + what.payload +
                            "<error>105</error></response>"));

    performed result = what.perform();

    EXPECT_EQ(result.status, 105);
    EXPECT_FALSE(result.handed_out);
}

INSTANTIATE_TEST_SUITE_P(All, ResultThatIsNoSuccess,
                         testing::Combine(testing::ValuesIn(operations),
                                          testing::Values("success", "SUCCESS", "Success ",
                                                          " Success", "Successful", "Succes",
                                                          "Error")));

TEST_P(Operation, FailsWithAReplyThatIsDamagedBehindASuccess)
{
    const std::string reply = "<response><result>Success</result>" +
                              std::string(GetParam().payload) + "<damaged></response>";

    performed result = perform_with(xml_reply(reply));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(
        log.text().find(GetParam().whole_log(reply) + "Expat failed parsing a node with error 0\n"),
        0u);
}

TEST_P(Operation, TellsTheHookOfARefusalThatIsDamagedBehindItsNumber)
{
    const std::string reply =
        "<response><result>Error</result><message>No</message><error>105</error><damaged>";

    performed result = perform_with(xml_reply(reply));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, unreadable_error);
    EXPECT_FALSE(result.handed_out);
    expect_hook_call(reply, 105, unreadable_error);
}

TEST_P(Operation, TellsTheHookOfARefusalThatIsDamagedBeforeItsNumber)
{
    const std::string reply = "<response><result>Error</result><damaged></response>";

    performed result = perform_with(xml_reply(reply));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_EQ(result.message, unreadable_error);
    expect_hook_call(reply, QM_MALFORMED_REPLY, unreadable_error);
}

TEST_P(Operation, CallsAPageOfHtmlMalformed)
{
    performed result =
        perform_with(http_reply(200,
                                "<!DOCTYPE html>\n<html><head><meta charset=\"utf-8\">"
                                "<title>Log in</title></head><body>Log in<br></body></html>",
                                {"Content-Type: text/html"}));

    expect_failed_exchange(result, QM_MALFORMED_REPLY, unusable(200));
}

TEST_P(Operation, CallsAWellFormedPageOfHtmlUnusable)
{
    performed result =
        perform_with(http_reply(200, "<html><head><title>Log in</title></head><body/></html>"));

    expect_failed_exchange(result, QM_UNUSABLE_RESPONSE, unusable(200));
}

TEST_P(Operation, CallsAReplyOfOneNulByteMalformed)
{
    performed result = perform_with(http_reply(502, std::string("\0", 1)));

    expect_failed_exchange(result, QM_MALFORMED_REPLY, unusable(502));
}

TEST_P(Operation, TakesAReplyThatIsPaddedToMegabytes)
{
    const std::string padding = "<padding>" + std::string(8 * 1000 * 1000, 'p') + "</padding>";

    performed result = perform_with(xml_reply("<response>" + padding + "<result>Success</result>" +
                                              GetParam().payload + "</response>"));

    EXPECT_EQ(result.status, 0);
    EXPECT_TRUE(result.handed_out);
}

TEST_P(Operation, RefusesAnEntityBomb)
{
    std::string bomb = "<!DOCTYPE r [<!ENTITY a \"" + std::string(50000, 'x') + "\">]><r><result>";
    for (int i = 0; i < 20000; ++i)
        bomb += "&a;";

    performed result = perform_with(xml_reply(bomb + "</result></r>"));

    EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
    EXPECT_FALSE(result.handed_out);
}

} // namespace
} // namespace quillmere_test
