#include "api/operations.h"

#include <cstdlib>
#include <ostream>

#include "api/deliberate_leak.h"
#include "api/taken_results.h"

namespace quillmere_test {

pkey_slot::pkey_slot() : place_(static_cast<char **>(std::malloc(sizeof(char *))))
{
    *place_ = nullptr;
}

std::optional<std::string> pkey_slot::take()
{
    std::optional<std::string> text = taken(*place_);
    std::free(place_);
    place_ = nullptr;
    return text;
}

namespace {

performed limits()
{
    auto *record = rubbish<system_limits>();
    char *message = rubbish<char>();
    int32_t status = get_system_limits(&record, &message);
    performed result = {status, taken(message), record != nullptr};
    system_limits_delete(&record);
    return result;
}

performed system()
{
    auto *record = rubbish<system_status>();
    char *message = rubbish<char>();
    int32_t status = get_system_status(&record, &message);
    performed result = {status, taken(message), record != nullptr};
    system_status_delete(&record);
    return result;
}

performed device()
{
    uint64_t revision = 77;
    int32_t jobs = 77;
    char *message = rubbish<char>();
    int32_t status = get_device_status("session+token", 12, &revision, &jobs, &message);
    return {status, taken(message), revision != 0 || jobs != 0};
}

// The last out-parameter is the token after a success, and the message after a failure.
performed told_apart(int32_t status, char *token_or_message)
{
    std::optional<std::string> text = taken(token_or_message);
    if (status == QM_OK)
        return {status, std::nullopt, text.has_value()};
    return {status, text, false};
}

performed session()
{
    char *token = rubbish<char>();
    int32_t status = get_session_token("user@example.com", "pa&ss w/rd%", nullptr, "42",
                                       "key of the application", &token);
    return told_apart(status, token);
}

performed login()
{
    pkey_slot pkey;
    char *token = rubbish<char>();
    int32_t status;
    {
        deliberate_leak of_the_pkey_of_a_malformed_reply;
        status = get_login_token("user@example.com", "pa&ss w/rd%", "42", "key of the application",
                                 pkey.place(), &token);
    }
    if (status != QM_MALFORMED_REPLY)
        pkey.take();
    return told_apart(status, token);
}

performed renewal()
{
    char *token = rubbish<char>();
    int32_t status = renew_session_token("session+token", &token);
    return told_apart(status, token);
}

} // namespace

const operation operations[6] = {
    {"get_system_limits", limits, &get_system_limits_uri, "", "",
     "get_system_limits url: ", logged_reply::text, "<max_keys>10</max_keys>", true},
    {"get_system_status", system, &get_system_status_uri, "", "",
     "get_system_status url: ", logged_reply::text, "<database>ok</database>", true},
    {"get_device_status", device, &get_device_status_uri,
     "?session_token=session+token&device_id=12&version=2",
     "?session_token=session+token&device_id=12&version=2", "get_status url: ", logged_reply::text,
     "<device_revision>7</device_revision><async_jobs_in_progress>yes</async_jobs_in_progress>",
     true},
    {"get_session_token", session, &get_session_token_uri,
     "?application_id=42&email=user%40example%2ecom&password=pa%26ss%20w%2frd%25"
     "&signature=c3182a3d5fc409b124806fb498ea97318c374845&version=2",
     "?application_id=42&email=user%40example%2ecom&password=(omitted)&signature=(omitted)"
     "&version=2",
     "Session token url:\n", logged_reply::text_and_length, "<session_token>new</session_token>",
     true},
    {"get_login_token", login, &get_login_token_uri,
     "?email=user%40example%2ecom&password=pa%26ss%20w%2frd%25&application_id=42"
     "&signature=c3182a3d5fc409b124806fb498ea97318c374845&version=2",
     "?email=user%40example%2ecom&password=(omitted)&application_id=42&signature=(omitted)"
     "&version=2",
     "get_login_token url:\n", logged_reply::none,
     "<pkey>key</pkey><login_token>once</login_token>", false},
    {"renew_session_token", renewal, &renew_session_token_uri,
     "?session_token=session+token&version=2", nullptr, nullptr, logged_reply::text_and_length,
     "<session_token>new</session_token>", false},
};

void PrintTo(const operation &each, std::ostream *out) { *out << each.name; }

std::string operation::url_log() const
{
    return url_heading ? std::string(url_heading) + urls[1] + *path + logged_query + "\n" : "";
}

std::string operation::reply_log(const std::optional<std::string> &reply_text) const
{
    if (reply == logged_reply::none)
        return "";
    std::string lines = "Got text:\n" + reply_text.value_or("(null)") + "\n";
    if (reply == logged_reply::text_and_length)
        lines += "Text len: " + std::to_string(reply_text.value_or("").size()) + "\n";
    return lines;
}

std::string operation::whole_log(const std::string &reply_text) const
{
    return url_log() + reply_log(reply_text);
}

std::string operation::success() const
{
    return std::string("<response><result>Success</result>") + payload + "</response>";
}

} // namespace quillmere_test
