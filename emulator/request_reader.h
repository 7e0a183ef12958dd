// Requests as they are read: the header first and alone, so that what follows can depend on it.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include <boost/asio/buffer.hpp>
#include <boost/system/error_code.hpp>

#include "server_limits.h"
#include "service.h"

namespace emulator {

/**
 * Takes bytes in, whatever they come over. It stands here and not with the connection, so that what
 * parses is compiled once, not once for each kind of stream.
 */
class request_reader {
public:
    using error_code = boost::system::error_code;

    explicit request_reader(const server_limits &limits);
    ~request_reader();

    /** Awaits the header of the next request. */
    void expect_header();
    /** Awaits its body, whole. */
    void expect_body();
    /** Awaits its body, which the receiver takes as it comes. */
    void expect_upload(body_receiver &receiver);

    /** Success once what is awaited is there, or else that it is unfinished, or what is wrong. */
    error_code parse();

    /** Where the next bytes go. Empty when no more fit, which means that the header is too large.
     */
    boost::asio::mutable_buffer room();
    void arrived(std::size_t count);
    /** No more will come. The result is as that of parse. */
    error_code end();

    /**
     * The request whose header has just come, without its body.
     *
     * @param scheme with "://" behind it
     * @param port   of this end of the connection
     */
    request head(const std::string &scheme, std::uint16_t port);
    std::string take_body();
    // Of the same request, from then on.
    bool awaits_invitation() const;
    bool keeps_alive() const;
    unsigned http_version() const;

    /** Gives back what an upload needed. */
    void shrink();

    static bool is_unfinished(const error_code &problem);
    /** Whether the client has sent more than is allowed, be it header or body. */
    static bool is_header_too_large(const error_code &problem);
    static bool is_body_too_large(const error_code &problem);
    /** Whether the client has broken the protocol, other than by leaving. */
    static bool is_protocol_fault(const error_code &problem);

private:
    struct parts;
    std::unique_ptr<parts> parts_;
};

} // namespace emulator
