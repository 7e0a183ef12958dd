#include "loopback_address.h"

#include <boost/asio/ip/address.hpp>

#include "text.h"

namespace emulator {

std::string loopback_address::http_url() const
{
    const bool is_ipv6 = host.find(':') != host.npos;
    return "http://" + (is_ipv6 ? "[" + host + "]" : host) + ":" + std::to_string(port);
}

std::optional<loopback_address> parse_loopback_address(const std::string &text)
{
    const std::size_t colon = text.rfind(':');
    if (colon == text.npos)
        return std::nullopt;
    std::string host = text.substr(0, colon);
    const bool is_bracketed = host.size() > 1 && host.front() == '[' && host.back() == ']';
    if (is_bracketed)
        host = host.substr(1, host.size() - 2);
    const auto port = parse_decimal(std::string_view(text).substr(colon + 1), 65535);
    boost::system::error_code problem;
    const auto address = boost::asio::ip::make_address(host, problem);
    if (!port || problem || address.is_v6() != is_bracketed || !address.is_loopback())
        return std::nullopt;
    return loopback_address{host, static_cast<std::uint16_t>(*port)};
}

} // namespace emulator
