// The operations, each as a call whose whole outcome can be compared.
#include <memory>

#include "api/account_operations.h"
#include "api/deliberate_leak.h"
#include "api/operations.h"
#include "api/taken_results.h"
#include "exhaustion/subject.h"

namespace quillmere_test {
namespace {

call_outcome system_limits_call()
{
    auto *limits = rubbish<system_limits>();
    char *message = rubbish<char>();
    int32_t status = get_system_limits(&limits, &message);
    return outcome_of(status, message, taken_record(limits));
}

call_outcome system_status_call()
{
    auto *record = rubbish<system_status>();
    char *message = rubbish<char>();
    int32_t status = get_system_status(&record, &message);
    return outcome_of(status, message, taken_record(record));
}

call_outcome device_status_call()
{
    auto revision = static_cast<uint64_t>(rubbish_number);
    int32_t jobs = rubbish_number;
    char *message = rubbish<char>();
    int32_t status = get_device_status("token", 12, &revision, &jobs, &message);
    return outcome_of(status, message,
                      taken_number("revision", revision) + " " + taken_number("jobs", jobs));
}

call_outcome session_token_call()
{
    char *token = rubbish<char>();
    int32_t status =
        get_session_token("user@example.com", "pass word", nullptr, "42", "key", &token);
    return outcome_of(status, nullptr, taken("token", token));
}

call_outcome renewal_call()
{
    char *token = rubbish<char>();
    int32_t status = renew_session_token("token", &token);
    return outcome_of(status, nullptr, taken("token", token));
}

starved_call login_token_call()
{
    // Malloc memory of the caller's, and after a malformed reply the library's.
    const deliberate_leak of_the_slot_of_a_malformed_reply;
    auto pkey = std::make_shared<pkey_slot>();
    return [pkey] {
        char *token = rubbish<char>();
        const deliberate_leak of_its_pkey;
        int32_t status =
            get_login_token("user@example.com", "pass word", "42", "key", pkey->place(), &token);
        std::string slot = "freed";
        if (status != QM_MALFORMED_REPLY)
            slot = pkey->take().value_or("NULL");
        return outcome_of(status, nullptr, taken("token", token) + " pkey=" + slot);
    };
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

std::string payload_of(const std::string &name)
{
    for (const operation &each : operations)
        if (each.name == name)
            return each.payload;
    return "";
}

std::vector<subject> all_operations()
{
    std::vector<subject> all;
    for (const account_operation &each : account_operations)
        all.push_back({each.name, without_preparation(each.call), each.elements});
    const std::pair<const char *, call_outcome (*)()> others[] = {
        {"get_system_limits", system_limits_call}, {"get_system_status", system_status_call},
        {"get_device_status", device_status_call}, {"get_session_token", session_token_call},
        {"renew_session_token", renewal_call},     {"update_file", update_file_call},
    };
    for (const auto &[name, call] : others)
        all.push_back({name, without_preparation(call), payload_of(name)});
    all.push_back({"get_login_token", login_token_call, payload_of("get_login_token")});
    return all;
}

} // namespace

const std::vector<subject> &operation_subjects()
{
    static const std::vector<subject> all = all_operations();
    return all;
}

} // namespace quillmere_test
