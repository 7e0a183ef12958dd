#include "settings.h"

#include <algorithm>
#include <charconv>
#include <iterator>

#include "failure.h"
#include "text.h"

namespace quillmere::tools {

namespace {

constexpr const char *service_variable = "QUILLMERE_SERVICE";
constexpr const char *emulator_variable = "QUILLMERE_EMULATOR";

/** What libcurl asks for the proxy of an encrypted address. */
constexpr const char *proxy_variables[] = {"https_proxy", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"};

struct service_choice {
    std::string base;
    std::optional<emulator_address> emulator;
};

service_choice emulated(const std::string &ready_file)
{
    const emulator_address address = read_ready_file(ready_file);
    return {address.secure_base, address};
}

service_choice at_address(const std::string &address, const std::string &source)
{
    return {normal_base_address(address, source), std::nullopt};
}

service_choice choose_in_environment(const std::optional<std::string> &service,
                                     const std::optional<std::string> &emulator)
{
    if (service && emulator)
        throw failure(exit_code::usage,
                      std::string(service_variable) + " and " + emulator_variable +
                          " name two services",
                      "unset one of them");
    return service ? at_address(*service, service_variable) : emulated(*emulator);
}

service_choice choose_service(const common_arguments &given, const setting_sources &sources)
{
    if (given.service)
        return at_address(*given.service, "--service");
    if (given.emulator)
        return emulated(*given.emulator);

    const auto service = sources.surroundings.value(service_variable);
    const auto emulator = sources.surroundings.value(emulator_variable);
    if (service || emulator)
        return choose_in_environment(service, emulator);

    if (const auto configured = sources.chosen_profile.value("service"))
        return at_address(*configured, "service in " + sources.chosen_profile.place("service"));
    if (sources.signed_in)
        return at_address(sources.signed_in->service, "service in the session file");
    return {sources.default_service, std::nullopt};
}

ca_bundle choose_bundle(const common_arguments &given, const setting_sources &sources,
                        const service_choice &service)
{
    ca_candidates candidates;
    candidates.flag = given.ca_file;
    candidates.profile = sources.chosen_profile.value("ca_file");
    candidates.environment = sources.surroundings.value("SSL_CERT_FILE");
    if (service.emulator)
        candidates.emulator = service.emulator->ca_file;
    candidates.system = sources.system_bundles;
    return choose_ca_bundle(candidates);
}

std::string choose_plain_base(const common_arguments &given, const service_choice &service)
{
    // What the library would send unencrypted goes over TLS too, unless the user wants otherwise.
    if (!given.plain_http)
        return service.base;
    return service.emulator ? service.emulator->plain_base : plain_base_of(service.base);
}

int choose_number(const std::optional<int> &flag, const profile &chosen, const char *key,
                  int smallest, int otherwise)
{
    if (flag)
        return *flag;
    const auto text = chosen.value(key);
    if (!text)
        return otherwise;
    int number = 0;
    const char *const end = text->data() + text->size();
    const auto [stop, error] = std::from_chars(text->data(), end, number);
    if (error != std::errc() || stop != end || number < smallest)
        throw failure(exit_code::local_file,
                      std::string(key) + " in " + chosen.place(key) +
                          " is no usable number: " + *text,
                      "a number from " + std::to_string(smallest) + " on is needed");
    return number;
}

/** Where the host of an address begins, behind the scheme if there is one. */
std::size_t address_start(const std::string &address)
{
    const std::size_t scheme = address.find("://");
    return scheme == std::string::npos ? 0 : scheme + 3;
}

void check_proxy(const proxy_choice &chosen, exit_code whose)
{
    const std::string_view rest = std::string_view(chosen.url).substr(address_start(chosen.url));
    const std::string_view user = rest.substr(0, std::min(rest.find('@'), rest.size()));
    if (user.size() < rest.size() && user.find(':') != std::string_view::npos)
        throw failure(whose, "the proxy of " + chosen.source + " holds a password",
                      "others can read it there: set https_proxy in the environment instead");
    const bool clean = std::all_of(chosen.url.begin(), chosen.url.end(),
                                   [](char letter) { return letter > ' ' && letter < 0x7f; });
    if (rest.empty() || !clean)
        throw failure(whose, "the proxy of " + chosen.source + " is no address: " + chosen.url,
                      "it looks like http://host:port");
}

bool has_proxy(const environment &surroundings)
{
    const auto is_set = [&](const char *name) { return surroundings.value(name).has_value(); };
    return std::any_of(std::begin(proxy_variables), std::end(proxy_variables), is_set);
}

std::optional<proxy_choice> choose_proxy(const common_arguments &given,
                                         const setting_sources &sources)
{
    const profile &chosen = sources.chosen_profile;
    if (given.proxy) {
        const proxy_choice proxy = {*given.proxy, "--proxy"};
        check_proxy(proxy, exit_code::usage);
        return proxy;
    }
    const auto configured = chosen.value("proxy");
    if (!configured || has_proxy(sources.surroundings))
        return std::nullopt;
    const proxy_choice proxy = {*configured, chosen.place("proxy")};
    check_proxy(proxy, exit_code::local_file);
    return proxy;
}

/** A path of the configuration file, which is read from any working folder. */
std::string absolute(const std::string &path, const environment &surroundings,
                     const std::string &place)
{
    if (path.front() == '/')
        return path;
    const auto home = surroundings.value("HOME");
    if (home && starts_with(path, "~/"))
        return *home + path.substr(1);
    throw failure(exit_code::local_file, "session_file in " + place + " is no whole path: " + path,
                  "it begins with / or ~/");
}

} // namespace

session_file choose_session_file(const common_arguments &given, const environment &surroundings,
                                 const profile &chosen_profile)
{
    constexpr auto others = folder_owner::somebody;
    if (given.session_file)
        return session_file(*given.session_file, others);
    if (const auto variable = surroundings.value("QUILLMERE_SESSION_FILE"))
        return session_file(*variable, others);
    if (const auto configured = chosen_profile.value("session_file"))
        return session_file(
            absolute(*configured, surroundings, chosen_profile.place("session_file")), others);
    return session_file(session_path(surroundings));
}

settings decide_settings(const common_arguments &given, const setting_sources &sources)
{
    const service_choice service = choose_service(given, sources);
    settings decided;
    decided.addresses = addresses_of(service.base, choose_plain_base(given, service));
    decided.emulator = service.emulator;
    // Where else uploads could not reach it: they take TLS on the standard port alone.
    if (service.emulator)
        decided.addresses.plain_upload = upload_address_on(service.emulator->plain_base);
    if (!given.insecure)
        decided.ca = choose_bundle(given, sources, service);
    decided.proxy = choose_proxy(given, sources);
    const profile &chosen = sources.chosen_profile;
    decided.timeout_seconds =
        choose_number(given.timeout, chosen, "timeout", 1, decided.timeout_seconds);
    decided.retries = choose_number(given.retries, chosen, "retries", 0, decided.retries);
    return decided;
}

} // namespace quillmere::tools
