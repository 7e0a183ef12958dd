// A whole operation over a stubbed exchange: which one, the code of the reply, the reply.
#include <sstream>

#include "api/account_operations.h"
#include "api/operations.h"
#include "support/choices.h"
#include "support/library.h"
#include "support/reference_document.h"
#include "support/stubbed_exchange.h"

namespace quillmere_fuzz {
namespace {

using quillmere_test::account_operation;
using quillmere_test::account_operations;
using quillmere_test::error_reading;

// What an operation must make of a reply.
struct verdict {
    int32_t status;
    std::optional<std::string> message;
    bool refused = false; // and so told to the hook
};

int hook_calls = 0;
int32_t hook_status = 0;

int32_t count_call(const char *, const char *, int32_t status, const char *)
{
    ++hook_calls;
    hook_status = status;
    return 0;
}

verdict failed_exchange(int64_t code)
{
    if (code < 1)
        return {QM_NO_RESPONSE, "Response error: no server HTTP response code received"};
    return {QM_UNUSABLE_RESPONSE,
            "Response error: received server HTTP response code " + std::to_string(code)};
}

verdict refusal(const document &reply, error_reading reading)
{
    reference_error error = read_error(reply);
    if (reading == error_reading::direct) {
        if (!look_up(reply, "error"))
            error.number = QM_NO_ERROR_ELEMENT;
        else
            error.number = std::atoi(look_up(reply, "error")->c_str());
        if (error.number == 0)
            error.number = QM_UNUSABLE_ERROR_NUMBER;
        error.message = look_up(reply, "message");
    }
    return {error.number, error.message, true};
}

verdict verdict_on(const stubbed_exchange &exchange, error_reading reading)
{
    if (!exchange.body)
        return failed_exchange(exchange.code);
    document reply = read_document(*exchange.body);
    std::optional<std::string> result = look_up(reply, "result");
    verdict found = !result                ? failed_exchange(exchange.code)
                    : *result == "Success" ? verdict{QM_OK, std::nullopt}
                                           : refusal(reply, reading);
    if (!reply.well_formed)
        found.status = QM_MALFORMED_REPLY;
    return found;
}

// Two operations tell nothing apart but a missing code, and give no message.
verdict without_reasons(verdict expected, const stubbed_exchange &exchange)
{
    bool failed = expected.status == QM_NO_RESPONSE || expected.status == QM_UNUSABLE_RESPONSE;
    if (!failed || expected.refused)
        return expected;
    bool unanswered = !exchange.body && exchange.code == 0;
    return {unanswered ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE, std::nullopt};
}

void check_hook(const verdict &expected, bool well_formed)
{
    expect(hook_calls == (expected.refused ? 1 : 0), "the hook is told of refusals alone");
    if (expected.refused && well_formed)
        expect(hook_status == expected.status, "the hook is told the status");
}

// Damage may be found when numbers have been read already, but nothing that must be released is
// handed out then.
bool holds_nothing(const std::string &results, const std::string &nothing)
{
    std::istringstream words(nothing);
    for (std::string word; words >> word;)
        if (word.find("NULL") != std::string::npos && results.find(word) == std::string::npos)
            return false;
    return true;
}

void check_results(const account_operation &operation, const quillmere_test::call_outcome &outcome,
                   bool feed)
{
    if (outcome.status == QM_OK)
        return;
    if (outcome.status == QM_MALFORMED_REPLY)
        expect(feed || holds_nothing(outcome.results, operation.nothing),
               "damage hands nothing out");
    else
        expect(outcome.results == operation.nothing, "a failure hands nothing out");
}

void check_account_operation(const account_operation &operation, const verdict &expected,
                             const quillmere_test::call_outcome &outcome)
{
    // A record within a record stops the reading of a feed that is well-formed otherwise.
    bool feed = std::string_view(operation.name) == "get_device_changes";
    bool stopped = feed && expected.status == QM_OK && outcome.status == QM_MALFORMED_REPLY;
    // A success without what was asked for is one that cannot be used.
    bool empty = expected.status == QM_OK && outcome.status == QM_UNUSABLE_RESPONSE;
    expect(outcome.status == expected.status || stopped || empty, "the status");
    if (operation.explains_failures || expected.refused)
        expect(outcome.message == expected.message, "the message");
    check_results(operation, outcome, feed);
}

void try_account_operation(const account_operation &operation, size_t bytes)
{
    quillmere_test::call_outcome outcome;
    within_budget(listed, bytes, [&] { outcome = operation.call(); });
    if (bytes > most_bytes_to_compare)
        return;
    verdict expected = verdict_on(the_exchange(), operation.errors);
    check_hook(expected, expected.status != QM_MALFORMED_REPLY);
    if (!operation.explains_failures)
        expected = without_reasons(expected, the_exchange());
    check_account_operation(operation, expected, outcome);
}

void try_other_operation(const quillmere_test::operation &operation, size_t bytes)
{
    quillmere_test::performed outcome;
    within_budget(listed, bytes, [&] { outcome = operation.perform(); });
    if (bytes > most_bytes_to_compare)
        return;
    verdict expected = verdict_on(the_exchange(), error_reading::standard);
    check_hook(expected, expected.status != QM_MALFORMED_REPLY);
    if (std::string_view(operation.name) == "get_login_token")
        expected = without_reasons(expected, the_exchange());
    // A success without its token is one that cannot be used.
    bool tokenless = expected.status == QM_OK && outcome.status == QM_UNUSABLE_RESPONSE;
    expect(outcome.status == expected.status || tokenless, "the status");
    if (outcome.status > 0)
        expect(outcome.message == expected.message, "the message of a refusal");
    if (outcome.status != QM_OK && outcome.status != QM_MALFORMED_REPLY)
        expect(!outcome.handed_out, "a failure hands nothing out");
}

void try_operation(std::string_view input)
{
    silence_log();
    check_api_error = count_call;
    hook_calls = 0;
    choices chosen(input);
    size_t number =
        chosen.below(std::size(account_operations) + std::size(quillmere_test::operations));
    bool replies = chosen.yes();
    the_exchange().code = chosen.byte() * 3 - 1; // from -1 on
    the_exchange().body.reset();
    if (replies)
        the_exchange().body = std::string(chosen.rest());

    if (number < std::size(account_operations))
        try_account_operation(account_operations[number], input.size());
    else
        try_other_operation(quillmere_test::operations[number - std::size(account_operations)],
                            input.size());
}

const known_target operation("operation", try_operation);

} // namespace
} // namespace quillmere_fuzz
