#include "examination.h"

#include <algorithm>
#include <cstdlib>

#include <curl/curl.h>
#include <expat.h>
#include <quillmere.h>

#include "../heap.h"
#include "../private_file.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

using std::chrono::microseconds;
using std::chrono::seconds;

/** Beyond this a certificate or a signature may be judged by the wrong time. */
constexpr seconds most_clock_difference{60};

examined_step good(const char *name, const std::string &detail,
                   std::optional<microseconds> time = std::nullopt)
{
    return {name, finding::ok, time, detail, {}, exit_code::done};
}

examined_step bad(const char *name, const failure &problem)
{
    return {name, finding::failed, std::nullopt, problem.why, problem.advice, problem.code};
}

examined_step skipped(const char *name, const std::string &why)
{
    return {name, finding::skipped, std::nullopt, why, {}, exit_code::done};
}

bool failed(const examined_step &step) { return step.result == finding::failed; }

examined_step versions()
{
    const curl_version_info_data *const curl = curl_version_info(CURLVERSION_NOW);
    const char *const tls = curl->ssl_version;
    return good("versions", std::string("quillmere ") + quillmere_version() + ", libcurl " +
                                curl->version + ", " + (tls == nullptr ? "no TLS" : tls) + ", " +
                                XML_ExpatVersion());
}

std::string count_of_certificates(const std::string &path)
{
    const std::string text = read_small_file(path, "the certificate authorities");
    std::size_t count = 0;
    for (std::size_t at = text.find("-----BEGIN "); at != std::string::npos;
         at = text.find("-----BEGIN ", at + 1))
        ++count;
    return std::to_string(count) + (count == 1 ? " certificate" : " certificates");
}

examined_step authorities(const settings &chosen)
{
    if (!chosen.ca)
        return skipped("ca", "--insecure is given: no certificate is verified");
    return good("ca", chosen.ca->path + ", named by " + chosen.ca->source + ", " +
                          count_of_certificates(chosen.ca->path));
}

/** The first of these variables that is set, as libcurl looks for them. */
std::optional<proxy_choice> proxy_of_environment(const environment &surroundings)
{
    for (const char *name : {"https_proxy", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"})
        if (const auto url = surroundings.value(name))
            return proxy_choice{*url, name};
    return std::nullopt;
}

examined_step proxy(const settings &chosen, const environment &surroundings)
{
    if (chosen.emulator)
        return good("proxy", "none: an emulator is asked directly");
    const auto found = chosen.proxy ? chosen.proxy : proxy_of_environment(surroundings);
    if (!found)
        return good("proxy", "none");
    std::string exceptions;
    for (const char *name : {"no_proxy", "NO_PROXY"})
        if (const auto value = surroundings.value(name); value && exceptions.empty())
            exceptions = ", but not for " + *value;
    return good("proxy",
                without_credentials(found->url) + ", named by " + found->source + exceptions);
}

examined_step session_step(command_context &context, const settings &chosen)
{
    try {
        const auto current = context.sessions.load();
        if (!current)
            return good("session", "nobody is signed in");
        const std::string who = current->email.empty() ? "" : " as " + current->email;
        if (current->service != chosen.addresses.secure)
            return good("session", "signed in to another service, " + current->service + who);
        return good("session", "signed in" + who);
    } catch (const failure &problem) {
        return bad("session", problem);
    }
}

struct stage_words {
    stage which;
    const char *name;
};
constexpr stage_words stages[] = {{stage::lookup, "dns"},
                                  {stage::connection, "connect"},
                                  {stage::handshake, "tls"},
                                  {stage::answer, "answer"}};

std::string description_of(const service_certificate &shown)
{
    return "certificate of " + shown.subject + ", issued by " + shown.issuer + ", good until " +
           shown.expires;
}

std::string host_of(const settings &chosen)
{
    const std::string &base = chosen.addresses.secure;
    const std::size_t start = base.find("://") + 3;
    return base.substr(start, base.find('/', start) - start);
}

std::string success_of(stage which, const connection_probe &found, const settings &chosen)
{
    switch (which) {
    case stage::lookup:
        return host_of(chosen);
    case stage::connection:
        return found.address.empty() ? host_of(chosen) : found.address;
    case stage::handshake:
        return found.certificate ? description_of(*found.certificate) : "";
    case stage::answer:
        break;
    }
    return "HTTP " + std::to_string(found.http_status);
}

std::string tls_advice(const connection_probe &found, const settings &chosen)
{
    if (found.code != CURLE_PEER_FAILED_VERIFICATION || !chosen.ca)
        return "is this the address of an HTTPS service?";
    return "compare the date of this machine with the certificate's; a proxy or a service with "
           "authorities of its own needs them named with --ca-file, instead of " +
           chosen.ca->path;
}

std::string advice_for(const connection_probe &found, const settings &chosen)
{
    const bool late = found.code == CURLE_OPERATION_TIMEDOUT;
    switch (found.reached) {
    case stage::lookup:
        return found.code == CURLE_COULDNT_RESOLVE_PROXY
                   ? "check the proxy's name"
                   : "check the address, and whether this machine is connected";
    case stage::connection:
        if (chosen.emulator)
            return "is the emulator still running?";
        return late ? "a firewall may drop packets: try the proxy of your network with --proxy"
                    : "check the address and port, and the proxy";
    case stage::handshake:
        return tls_advice(found, chosen);
    case stage::answer:
        break;
    }
    return late ? "allow more time with --timeout" : "run it again with --verbose to see more";
}

std::string problem_of(const connection_probe &found)
{
    if (found.reached != stage::handshake || !found.certificate)
        return found.problem;
    return found.problem + ": " + description_of(*found.certificate);
}

std::string clock_text(seconds ahead)
{
    const auto off = std::abs(ahead.count());
    if (off <= 1)
        return "the same as the service's";
    return std::to_string(off) + (ahead.count() > 0 ? " s behind" : " s ahead of") +
           " the service's";
}

examined_step clock_step(const connection_probe &found)
{
    if (!found.clock_ahead)
        return skipped("clock", found.passed(stage::answer) ? "the service did not tell the time"
                                                            : "the service did not answer");
    const std::string text = clock_text(*found.clock_ahead);
    if (std::abs(found.clock_ahead->count()) <= most_clock_difference.count())
        return good("clock", text);
    return bad("clock",
               failure(exit_code::other, text, "set the clock of this machine: timedatectl"));
}

examined_step api_step(command_context &context)
{
    const auto begun = std::chrono::steady_clock::now();
    try {
        system_status *record = nullptr;
        context.remote().once("reading the service's status", [&](char **error_message) {
            return get_system_status(&record, error_message);
        });
        const system_status_owner owned(record);
        const char *const database = system_status_get_database(record);
        const auto time =
            std::chrono::duration_cast<microseconds>(std::chrono::steady_clock::now() - begun);
        return good("api",
                    std::string("the database is ") + (database == nullptr ? "not told" : database),
                    time);
    } catch (const failure &problem) {
        return bad("api", problem);
    }
}

void examine_service(command_context &context, const settings &chosen, examination &steps)
{
    steps.push_back(good("service", chosen.addresses.secure));
    steps.push_back(authorities(chosen));
    steps.push_back(proxy(chosen, context.surroundings));
    steps.push_back(session_step(context, chosen));
    context.remote(); // which starts the library, and libcurl with it
    add_connection_steps(probe_connection(chosen), chosen, steps);
    const bool reachable = std::none_of(steps.begin(), steps.end(), [](const examined_step &each) {
        return failed(each) && each.code == exit_code::network;
    });
    steps.push_back(reachable ? api_step(context) : skipped("api", "the service is not reached"));
}

} // namespace

const char *word_for(finding result)
{
    switch (result) {
    case finding::ok:
        return "ok";
    case finding::failed:
        return "failed";
    case finding::skipped:
        return "skipped";
    }
    return "failed";
}

std::string without_credentials(const std::string &address)
{
    const std::size_t scheme = address.find("://");
    const std::size_t start = scheme == std::string::npos ? 0 : scheme + 3;
    const std::size_t at = address.rfind('@');
    if (at == std::string::npos || at < start)
        return address;
    return address.substr(0, start) + "(masked)" + address.substr(at);
}

void add_connection_steps(const connection_probe &found, const settings &chosen, examination &steps)
{
    for (const auto &[which, name] : stages) {
        if (found.passed(which))
            steps.push_back(good(name, success_of(which, found, chosen), found.time_of(which)));
        else if (which == found.reached)
            steps.push_back(bad(
                name, failure(exit_code::network, problem_of(found), advice_for(found, chosen))));
        else
            steps.push_back(skipped(name, "the step before failed"));
    }
    steps.push_back(clock_step(found));
}

examination examine(command_context &context)
{
    examination steps = {versions()};
    try {
        examine_service(context, context.chosen(), steps);
    } catch (const failure &problem) {
        steps.push_back(bad("settings", problem));
    }
    return steps;
}

} // namespace quillmere::tools
