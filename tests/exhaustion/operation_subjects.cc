// The operations, each as a call whose whole outcome can be compared.
#include <memory>

#include "api/account_operations.h"
#include "api/deliberate_leak.h"
#include "api/sample_calls.h"
#include "api/taken_results.h"
#include "exhaustion/subject.h"

namespace quillmere_test {
namespace {

starved_call prepared_login_token_call()
{
    // Malloc memory of the caller's, and after a malformed reply the library's.
    const deliberate_leak of_the_slot_of_a_malformed_reply;
    auto pkey = std::make_shared<pkey_slot>();
    return [pkey] { return login_token_call(*pkey); };
}

call_outcome update_file_call()
{
    char *message = rubbish<char>();
    int32_t status =
        update_file("token", "key", "name", "text", "tag", "private", "time", &message);
    return outcome_of(status, message, "");
}

std::function<starved_call()> without_preparation(call_outcome (*call)())
{
    return [call] { return starved_call(call); };
}

std::vector<subject> all_operations()
{
    std::vector<subject> all;
    for (const account_operation &each : account_operations)
        all.push_back({each.name, without_preparation(each.call), each.elements});
    for (const sample_call &each : sample_calls)
        all.push_back({each.of.name, without_preparation(each.call), each.of.payload});
    all.push_back({"update_file", without_preparation(update_file_call)});
    const operation &login = operations[4];
    all.push_back({login.name, prepared_login_token_call, login.payload});
    return all;
}

} // namespace

const std::vector<subject> &operation_subjects()
{
    static const std::vector<subject> all = all_operations();
    return all;
}

} // namespace quillmere_test
