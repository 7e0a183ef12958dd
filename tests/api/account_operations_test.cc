// What the operations on an account have in common: the request, the log, the judgement of the
// exchange, refusals. One sample call of each stands for the others.
#include <gtest/gtest.h>

#include <string>

#include "api/account_operations.h"
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using optional_text = std::optional<std::string>;

std::string with_code(int64_t code)
{
    return "Response error: received server HTTP response code " + std::to_string(code);
}

class EveryAccountOperation : public library_test,
                              public testing::WithParamInterface<account_operation> {
protected:
    EveryAccountOperation() : path_before_(*operation.path_variable) {}
    ~EveryAccountOperation() override { *operation.path_variable = path_before_; }

    // A failed exchange's message, where this operation has one.
    optional_text explained(const std::string &message) const
    {
        return operation.explains_failures ? optional_text(message) : std::nullopt;
    }

    call_outcome failure(int32_t status, const optional_text &message) const
    {
        return {status, message, operation.nothing};
    }

    // Answers from a file, for which there is no response code.
    void answer_without_code(const std::string &reply)
    {
        folder_.write("reply", reply);
        point_at("file://" + folder_.path());
        *operation.path_variable = "/reply";
    }

    const account_operation &operation = GetParam();

private:
    const char *path_before_;
    temporary_folder folder_;
};

INSTANTIATE_TEST_SUITE_P(Api, EveryAccountOperation, testing::ValuesIn(account_operations),
                         [](const auto &tested) { return std::string(tested.param.name); });

TEST_P(EveryAccountOperation, HandsOutWhatTheReplyHolds)
{
    server.answer(xml_reply(operation.accepted_reply()));

    EXPECT_EQ(operation.call(), (call_outcome{QM_OK, std::nullopt, operation.results}));
}

TEST_P(EveryAccountOperation, SendsOneGetRequestToTheTlsBase)
{
    server.answer(xml_reply(operation.accepted_reply()));

    operation.call();

    ASSERT_EQ(server.requests().size(), 1u);
    request sent = server.requests().front();
    EXPECT_EQ(sent.method, "GET");
    EXPECT_EQ(sent.target, operation.target());
    EXPECT_EQ(sent.body, "");
    EXPECT_EQ(plain_server.connections(), 0u);
}

TEST_P(EveryAccountOperation, ReadsPathAndVersionAtEveryCall)
{
    server.answer(xml_reply(operation.accepted_reply()));
    *operation.path_variable = "/elsewhere";
    api_version = "1.5";

    operation.call();

    std::string query = operation.query;
    query.replace(query.find("&version=2"), 10, "&version=1.5");
    EXPECT_EQ(server.requests().front().target, "/elsewhere" + query);
}

TEST_P(EveryAccountOperation, HasItsPathFromTheStart)
{
    EXPECT_STREQ(*operation.path_variable, operation.path);
}

TEST_P(EveryAccountOperation, LogsUrlAndReply)
{
    std::string reply = operation.accepted_reply();
    server.answer(xml_reply(reply));

    operation.call();

    EXPECT_EQ(log.text(), operation.log_of(server.base_url(), reply) + operation.extraction_lines);
}

TEST_P(EveryAccountOperation, LogsAMissingReply)
{
    server.answer(http_reply(500, ""));

    operation.call();

    EXPECT_EQ(log.text(), operation.log_of(server.base_url(), ""));
}

TEST_P(EveryAccountOperation, LogsARefusal)
{
    std::string reply = refusing_reply("<error>105</error>");
    server.answer(xml_reply(reply));

    operation.call();

    EXPECT_EQ(log.text(), operation.log_of(server.base_url(), reply));
}

TEST_P(EveryAccountOperation, GoesByTheResultAndNotByTheResponseCode)
{
    server.answer(http_reply(500, operation.accepted_reply()));

    EXPECT_EQ(operation.call(), (call_outcome{QM_OK, std::nullopt, operation.results}));
}

TEST_P(EveryAccountOperation, NeedsNoResponseCodeForAResult)
{
    answer_without_code(operation.accepted_reply());

    EXPECT_EQ(operation.call(), (call_outcome{QM_OK, std::nullopt, operation.results}));
}

TEST_P(EveryAccountOperation, ReportsAFailedTransfer)
{
    refused_port nobody;
    point_at(nobody.base_url("https"));
    hook_recorder hook;

    // The revision alone tells a code below zero from none.
    int32_t status = operation.explains_failures ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE;
    EXPECT_EQ(operation.call(), failure(status, explained(no_code)));
    EXPECT_TRUE(hook.calls().empty());
}

TEST_P(EveryAccountOperation, ReportsThatNeitherCodeNorReplyCame)
{
    answer_without_code("");
    hook_recorder hook;

    EXPECT_EQ(operation.call(), failure(QM_NO_RESPONSE, explained(no_code)));
    EXPECT_TRUE(hook.calls().empty());
}

TEST_P(EveryAccountOperation, ReportsAReplyWithNeitherCodeNorResult)
{
    answer_without_code("<response/>");
    hook_recorder hook;

    int32_t status = operation.explains_failures ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE;
    EXPECT_EQ(operation.call(), failure(status, explained(no_code)));
    EXPECT_TRUE(hook.calls().empty());
}

TEST_P(EveryAccountOperation, ReportsAnEmptyReplyWithItsCode)
{
    for (int code : {200, 404, 500}) {
        server.answer(http_reply(code, ""));
        hook_recorder hook;

        EXPECT_EQ(operation.call(), failure(QM_UNUSABLE_RESPONSE, explained(with_code(code))));
        EXPECT_TRUE(hook.calls().empty());
    }
}

TEST_P(EveryAccountOperation, ReportsAReplyWithoutAResult)
{
    for (const char *reply : {"<response/>", "<response><error>105</error></response>",
                              "<response><result/></response>"}) {
        server.answer(http_reply(503, reply));
        hook_recorder hook;

        EXPECT_EQ(operation.call(), failure(QM_UNUSABLE_RESPONSE, explained(with_code(503))))
            << reply;
        EXPECT_TRUE(hook.calls().empty());
    }
}

TEST_P(EveryAccountOperation, ReturnsTheNumberAndMessageOfARefusal)
{
    std::string reply = refusing_reply("<error>105</error><message>Not &amp; never</message>");
    server.answer(http_reply(403, reply));
    hook_recorder hook;

    EXPECT_EQ(operation.call(), failure(105, "Not & never"));

    ASSERT_EQ(hook.calls().size(), 1u);
    hook_call told = hook.calls().front();
    EXPECT_EQ(told.url, server.base_url() + operation.target());
    EXPECT_EQ(told.response, reply);
    EXPECT_EQ(told.status, 105);
    EXPECT_EQ(told.message, "Not & never");
}

TEST_P(EveryAccountOperation, IsRefusedByAnyOtherResult)
{
    for (const char *result : {"success", "Success ", "SUCCESS", "Successful", "0"}) {
        std::string reply = "<response><result>" + std::string(result) +
                            "</result><error>7</error>" + operation.elements + "</response>";
        server.answer(xml_reply(reply));

        EXPECT_EQ(operation.call().status, 7) << result;
        EXPECT_EQ(operation.call().results, operation.nothing) << result;
    }
}

struct refusal_case {
    const char *elements;
    int32_t standard;
    int32_t direct;
};

TEST_P(EveryAccountOperation, ReadsTheNumbersOfRefusals)
{
    const refusal_case cases[] = {
        {"", QM_UNUSABLE_ERROR_NUMBER, QM_NO_ERROR_ELEMENT},
        {"<error/>", QM_UNUSABLE_ERROR_NUMBER, QM_NO_ERROR_ELEMENT},
        {"<error>0</error>", QM_UNUSABLE_ERROR_NUMBER, QM_UNUSABLE_ERROR_NUMBER},
        {"<error>abc</error>", QM_UNUSABLE_ERROR_NUMBER, QM_UNUSABLE_ERROR_NUMBER},
        {"<error> 12x</error>", 12, 12},
        {"<error>-5</error>", -5, -5},
        // Below another element only the direct reading finds the number.
        {"<details><error>13</error></details>", QM_UNUSABLE_ERROR_NUMBER, 13},
        {"<error>14</error><details><error>15</error></details>", 14, 1415},
    };
    for (const refusal_case &each : cases) {
        server.answer(xml_reply(refusing_reply(each.elements)));
        hook_recorder hook;
        int32_t status = operation.errors == error_reading::direct ? each.direct : each.standard;

        EXPECT_EQ(operation.call(), failure(status, std::nullopt)) << each.elements;

        ASSERT_EQ(hook.calls().size(), 1u);
        EXPECT_EQ(hook.calls().front().status, status);
        EXPECT_EQ(hook.calls().front().message, std::nullopt);
    }
}

TEST_P(EveryAccountOperation, FindsTheMessageOfARefusal)
{
    server.answer(xml_reply(refusing_reply("<error>1</error><in><message>deep</message></in>")));

    bool direct = operation.errors == error_reading::direct;
    EXPECT_EQ(operation.call(), failure(1, direct ? optional_text("deep") : std::nullopt));
}

TEST_P(EveryAccountOperation, ReportsAMalformedRefusal)
{
    std::string reply = "<response><result>Error</result><error>105</error><message>Wh";
    server.answer(xml_reply(reply));
    hook_recorder hook;
    optional_text message = operation.errors == error_reading::direct
                                ? "Wh"
                                : "Error parsing XML when trying to get error text";

    EXPECT_EQ(operation.call(), failure(QM_MALFORMED_REPLY, message));

    ASSERT_EQ(hook.calls().size(), 1u);
    EXPECT_EQ(hook.calls().front().url, server.base_url() + operation.target());
    EXPECT_EQ(hook.calls().front().response, reply);
    EXPECT_EQ(hook.calls().front().status, 105);
    EXPECT_EQ(hook.calls().front().message, message);
}

TEST_P(EveryAccountOperation, ReportsAMalformedRefusalWithoutANumber)
{
    server.answer(xml_reply("<response><result>Error</result><x>"));
    hook_recorder hook;
    bool direct = operation.errors == error_reading::direct;
    optional_text message;
    if (!direct)
        message = "Error parsing XML when trying to get error text";

    EXPECT_EQ(operation.call(), failure(QM_MALFORMED_REPLY, message));

    ASSERT_EQ(hook.calls().size(), 1u);
    EXPECT_EQ(hook.calls().front().status, direct ? QM_NO_ERROR_ELEMENT : QM_MALFORMED_REPLY);
    EXPECT_EQ(hook.calls().front().message, message);
}

TEST_P(EveryAccountOperation, ReportsWhatIsNoXml)
{
    server.answer(http_reply(502, "Bad gateway"));
    hook_recorder hook;

    EXPECT_EQ(operation.call(), failure(QM_MALFORMED_REPLY, explained(with_code(502))));
    EXPECT_TRUE(hook.calls().empty());
}

TEST_P(EveryAccountOperation, IsRefusedWhateverTheHookReturns)
{
    check_api_error = check_api_error_empty;
    server.answer(xml_reply(refusing_reply("<error>9</error>")));

    EXPECT_EQ(operation.call(), failure(9, std::nullopt));
}

} // namespace
} // namespace quillmere_test
