#include "exchange.h"

#include <charconv>
#include <iterator>

#include <quillmere.h>

#include "text.h"

namespace quillmere::tools {

namespace {

// The service's number for a session token that it does not know, or no longer.
constexpr std::int32_t session_invalid = 105;

constexpr const char *html_page =
    "an HTML page came instead of an API reply: a proxy or login page?";

/** libcurl's codes, as far as the command line has something to say about them. */
enum transport_code {
    unsupported_protocol = 1,
    malformed_url = 3,
    proxy_not_resolved = 5,
    host_not_resolved = 6,
    not_connected = 7,
    timed_out = 28,
    tls_handshake_failed = 35,
    certificate_refused = 60,
    ca_file_unusable = 77
};

/** What helps against the service's refusals, where more helps than to ask for something else. */
struct refusal_advice {
    std::int32_t number;
    const char *advice;
};
constexpr refusal_advice refusals[] = {
    {107, "check the e-mail address and the password"},
    {108, "check the application id: --app-id, QUILLMERE_APP_ID or app_id"},
    {109, "check the application key, and the password"},
    {112, "look at what is there with: quillmere ls"},
    {113, "look at what is there with: quillmere ls"},
    {114, "it belongs to another account, or is private"},
    {115, "choose another name"},
    {116, "choose a folder that is not as deep"},
    {117, "make room with: quillmere rm; quillmere whoami shows what is used"},
    {119, "wait until there is bandwidth again; quillmere whoami shows it"},
    {120, "choose another destination"},
    {123, "try again tomorrow"},
    {127, "somebody changed it meanwhile: look at it, then send it again"},
    {128, "send it again: it may have changed while it was read"},
};

const char *advice_on_status(std::int32_t number)
{
    for (const refusal_advice &each : refusals)
        if (each.number == number)
            return each.advice;
    return "";
}

bool is_permanent(int code)
{
    return code == unsupported_protocol || code == malformed_url || code == certificate_refused ||
           code == ca_file_unusable;
}

std::string certificate_advice(const exchange_setting &setting)
{
    if (!setting.ca)
        return "the service's certificate was not accepted";
    const std::string authorities = setting.emulator_root
                                        ? "the emulator's own, " + *setting.emulator_root + ","
                                        : std::string("the right authorities");
    return "the service's certificate is not vouched for by " + setting.ca->path + ", named by " +
           setting.ca->source + "; give " + authorities + " with --ca-file";
}

std::string network_advice(int code, const exchange_setting &setting)
{
    switch (code) {
    case certificate_refused:
        return certificate_advice(setting);
    case ca_file_unusable:
        return "the certificate authorities could not be read; name a PEM file with --ca-file";
    case host_not_resolved:
        return "check the address and the network";
    case proxy_not_resolved:
        return "check the proxy in the environment";
    case not_connected:
        return setting.emulator_root ? "is the emulator still running?"
                                     : "check the address, the network and the proxy";
    case timed_out:
        return "try again, or allow more time with --timeout";
    case tls_handshake_failed:
        return "is this the address of an HTTPS service?";
    default:
        return "run it again with --verbose to see more";
    }
}

failure network_failure(const exchange &ended, const std::string &action,
                        const exchange_setting &setting)
{
    const std::string reason = ended.error ? ended.error->text : "no HTTP answer";
    return failure(exit_code::network,
                   action + " failed: no answer from " + setting.service + ": " + reason,
                   network_advice(ended.error ? ended.error->code : 0, setting));
}

failure answer_failure(exit_code code, const exchange &ended, const std::string &action,
                       const std::string &otherwise)
{
    const auto http = http_status_of(ended.message);
    std::string why = action + " failed: ";
    why += ended.html ? html_page : otherwise;
    if (http)
        why += " (HTTP " + std::to_string(*http) + ")";
    return failure(code, why,
                   "check the address, or run it again with --verbose to see the answer");
}

failure refusal(const exchange &ended, const std::string &action)
{
    const std::string said = ended.message.empty() ? "the service gave no reason" : ended.message;
    if (ended.status == session_invalid)
        return failure(exit_code::not_signed_in,
                       action + " failed: the session has expired: " +
                           std::to_string(ended.status) + ": " + said,
                       "sign in again with: quillmere login");
    if (ended.status > 0)
        return failure(exit_code::refused,
                       action + " failed: " + std::to_string(ended.status) + ": " + said,
                       advice_on_status(ended.status));
    return failure(exit_code::refused,
                   action + " failed: refused without a usable error number: " + said,
                   "run it again with --verbose to see the answer");
}

failure failure_without_status(const exchange &ended, const std::string &action,
                               const exchange_setting &setting)
{
    switch (ended.status) {
    case QM_NO_RESPONSE:
        return network_failure(ended, action, setting);
    case QM_UNUSABLE_RESPONSE:
        return answer_failure(exit_code::bad_http_answer, ended, action,
                              "the service's answer is no API reply");
    case QM_MALFORMED_REPLY:
        return answer_failure(exit_code::unreadable_answer, ended, action,
                              "the service's answer is not well-formed XML");
    case QM_SIGNATURE_FAILED:
        return failure(exit_code::other, action + " failed: the request could not be signed",
                       "check the installation with: quillmere doctor");
    default:
        return refusal(ended, action);
    }
}

} // namespace

std::optional<int> http_status_of(const std::string &message)
{
    constexpr std::string_view beginning = "Response error: received server HTTP response code ";
    if (!starts_with(message, beginning))
        return std::nullopt;
    int status = 0;
    const char *const end = message.data() + message.size();
    const auto [stop, error] = std::from_chars(message.data() + beginning.size(), end, status);
    if (error != std::errc() || stop != end)
        return std::nullopt;
    return status;
}

bool worth_repeating(const exchange &ended)
{
    if (ended.status == QM_NO_RESPONSE)
        return !ended.error || !is_permanent(ended.error->code);
    // A page that is no XML, as overloaded servers send, turns the one status into the other.
    if (ended.status != QM_UNUSABLE_RESPONSE && ended.status != QM_MALFORMED_REPLY)
        return false;
    const int http = http_status_of(ended.message).value_or(0);
    return http == 429 || (http >= 500 && http <= 599);
}

failure failure_of(const exchange &ended, const std::string &action,
                   const exchange_setting &setting)
{
    failure problem = failure_without_status(ended, action, setting);
    problem.status = ended.status;
    return problem;
}

} // namespace quillmere::tools
