#include "api/sample_calls.h"

#include "api/deliberate_leak.h"
#include "api/taken_results.h"

namespace quillmere_test {
namespace {

call_outcome system_limits_call()
{
    auto *record = rubbish<system_limits>();
    char *message = rubbish<char>();
    int32_t status = get_system_limits(&record, &message);
    return outcome_of(status, message, taken_record(record));
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

} // namespace

const sample_call sample_calls[5] = {{operations[0], system_limits_call},
                                     {operations[1], system_status_call},
                                     {operations[2], device_status_call},
                                     {operations[3], session_token_call},
                                     {operations[5], renewal_call}};

call_outcome login_token_call(pkey_slot &pkey)
{
    char *token = rubbish<char>();
    const deliberate_leak of_its_pkey;
    int32_t status =
        get_login_token("user@example.com", "pass word", "42", "key", pkey.place(), &token);
    std::string slot = "freed";
    if (status != QM_MALFORMED_REPLY)
        slot = pkey.take().value_or("NULL");
    return outcome_of(status, nullptr, taken("token", token) + " pkey=" + slot);
}

} // namespace quillmere_test
