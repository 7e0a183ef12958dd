#include "settings.h"

#include <charconv>

#include "failure.h"

namespace quillmere::tools {

namespace {

constexpr const char *service_variable = "QUILLMERE_SERVICE";
constexpr const char *emulator_variable = "QUILLMERE_EMULATOR";

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
        return at_address(*configured, "service in the configuration file");
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
                      std::string(key) +
                          " in the configuration file is no usable number: " + *text);
    return number;
}

} // namespace

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
    const profile &chosen = sources.chosen_profile;
    decided.timeout_seconds =
        choose_number(given.timeout, chosen, "timeout", 1, decided.timeout_seconds);
    decided.retries = choose_number(given.retries, chosen, "retries", 0, decided.retries);
    return decided;
}

} // namespace quillmere::tools
