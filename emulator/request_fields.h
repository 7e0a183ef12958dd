// From a header as it was read to the request that is served.
#pragma once

#include <string>

#include <boost/beast/core/string.hpp>
#include <boost/beast/http/field.hpp>

#include "service.h"

namespace emulator {

/**
 * Where the client found the server, which links lead back to. What is no name of a host is not
 * repeated into them.
 *
 * @param scheme with "://" behind it
 * @param port   of this end of the connection
 */
inline std::string origin_of(const std::string &scheme, boost::beast::string_view host,
                             unsigned short port)
{
    const bool is_host =
        !host.empty() && host.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRST"
                                                "UVWXYZ0123456789.-:[]") == host.npos;
    return scheme + (is_host ? std::string(host) : "localhost:" + std::to_string(port));
}

/** All but the body. */
template <class Message> request request_of(const Message &message, std::string origin)
{
    using field = boost::beast::http::field;
    const auto text = [&message](auto name) { return std::string(message[name]); };
    return {std::string(message.method_string()),
            std::string(message.target()),
            text(field::content_type),
            {},
            std::move(origin),
            text(field::range),
            text(field::if_range),
            text(field::content_disposition),
            text("Content-Digest"),
            text("Repr-Digest"),
            text(field::origin)};
}

} // namespace emulator
