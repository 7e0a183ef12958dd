#include "service_address.h"

#include <algorithm>

#include "failure.h"
#include "text.h"

namespace quillmere::tools {

namespace {

constexpr std::string_view https = "https://";
constexpr const char *upload_path = "/api/upload/upload.php?type=desktop";

bool may_stand_in_address(char letter)
{
    return letter > ' ' && letter < 0x7f &&
           std::string_view("?#@\\\"<>").find(letter) == std::string_view::npos;
}

std::string_view port_of(std::string_view host_and_port)
{
    // The colons of a numeric IPv6 host stand in brackets.
    const std::size_t host_end = host_and_port.rfind(']');
    const std::size_t colon = host_and_port.rfind(':');
    if (colon == std::string_view::npos || (host_end != std::string_view::npos && colon < host_end))
        return {};
    return host_and_port.substr(colon + 1);
}

std::string_view port_of_base(const std::string &secure_base)
{
    const std::string_view rest = std::string_view(secure_base).substr(https.size());
    return port_of(rest.substr(0, rest.find('/')));
}

} // namespace

std::string normal_base_address(const std::string &address, const std::string &source)
{
    std::string_view base = trimmed(address);
    while (ends_with(base, "/"))
        base.remove_suffix(1);
    const std::string scheme = lower_case(base.substr(0, https.size()));
    const std::string_view rest = base.substr(std::min(base.size(), https.size()));
    const bool clean = std::all_of(rest.begin(), rest.end(), may_stand_in_address);
    if (scheme != https || rest.empty() || rest.front() == '/' || rest.front() == ':' || !clean)
        throw failure(exit_code::usage,
                      source + " is not the base address of a service: " + address,
                      "it looks like https://host or https://host:port");
    const std::size_t slash = std::min(rest.find('/'), rest.size());
    return scheme + lower_case(rest.substr(0, slash)) + std::string(rest.substr(slash));
}

service_addresses addresses_of(const std::string &secure_base, const std::string &plain_base)
{
    return {plain_base, secure_base, upload_address_on(plain_base), upload_address_on(secure_base)};
}

std::string upload_address_on(const std::string &base) { return base + upload_path; }

bool is_on_standard_port(const std::string &secure_base)
{
    const std::string_view port = port_of_base(secure_base);
    return port.empty() || port == "443";
}

std::string plain_base_of(const std::string &secure_base)
{
    const std::string_view rest = std::string_view(secure_base).substr(https.size());
    if (!is_on_standard_port(secure_base))
        throw failure(exit_code::usage,
                      "--plain-http cannot tell the unencrypted address of " + secure_base,
                      "it works with a service on the standard ports, or with --emulator");
    std::string plain = "http://" + std::string(rest);
    if (!port_of_base(secure_base).empty())
        plain.erase(plain.find(":443", https.size() - 1), 4);
    return plain;
}

} // namespace quillmere::tools
