#include "upload_route.h"

#include <arpa/inet.h>

#include "../failure.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

bool is_loopback(const std::string &host)
{
    in_addr v4 = {};
    in6_addr v6 = {};
    if (::inet_pton(AF_INET, host.c_str(), &v4) == 1)
        return (ntohl(v4.s_addr) >> 24) == 127;
    if (::inet_pton(AF_INET6, host.c_str(), &v6) == 1)
        return IN6_IS_ADDR_LOOPBACK(&v6);
    return lower_case(host) == "localhost";
}

} // namespace

bool is_on_this_machine(const std::string &plain_base)
{
    constexpr std::string_view http = "http://";
    // Ahead of an "@" stands a user's name, which may look like a host.
    if (!starts_with(plain_base, http) || plain_base.find('@') != std::string::npos)
        return false;
    std::string_view host = std::string_view(plain_base).substr(http.size());
    host = host.substr(0, host.find('/'));
    if (starts_with(host, "[")) {
        const std::size_t end = host.find(']');
        return end != std::string_view::npos && is_loopback(std::string(host.substr(1, end - 1)));
    }
    host = host.substr(0, host.find(':'));
    return is_loopback(std::string(host));
}

upload_route upload_route_of(const settings &chosen)
{
    if (is_on_standard_port(chosen.addresses.secure))
        return upload_route::tls;
    const std::string why = "nothing can be uploaded to " + chosen.addresses.secure +
                            ": uploads go over TLS on port 443 alone";
    if (!chosen.emulator)
        throw failure(exit_code::usage, why,
                      "an emulator on this machine is named with --emulator");
    if (!is_on_this_machine(chosen.emulator->plain_base))
        throw failure(exit_code::usage,
                      why + ", and " + chosen.emulator->plain_base +
                          " is not on this machine to go there unencrypted",
                      "run the command where the emulator runs");
    return upload_route::plain;
}

} // namespace quillmere::tools
