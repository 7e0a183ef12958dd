// HTTP and HTTPS on the loopback interface, with every limit in its own hands.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>

#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <boost/asio/ssl/context.hpp>

#include "envelope.h"
#include "errors.h"
#include "server_limits.h"
#include "service.h"

namespace emulator {

struct request_handlers {
    std::function<reply(const request &)> answer;
    /** Asked first, with the header alone; null when the body is to be read into the request. */
    std::function<std::unique_ptr<body_receiver>(const request &)> receive;
    /** What is told to who breaks the protocol or a limit. */
    std::function<reply(const refusal &)> refuse = [](const refusal &why) {
        return emulator::refuse(why);
    };
};

/** The certificate of the next connection; it must outlive the server. */
using certificate_choice = std::function<boost::asio::ssl::context &()>;

/** Serves on one thread, the one that runs the context: no handler is run twice at once. */
class http_server {
public:
    http_server(boost::asio::io_context &context, const server_limits &limits,
                request_handlers handlers);
    ~http_server();

    /**
     * Listens on 127.0.0.1 and, where the machine has it, on ::1, on one and the same port.
     *
     * @param port 0 lets the kernel pick one
     * @param tls  the certificates to serve HTTPS with, or null for HTTP
     * @return the port
     */
    std::uint16_t listen(std::uint16_t port, const certificate_choice &tls);

    /** Listens with HTTP on one address alone, which must be a loopback one. Returns the port. */
    std::uint16_t listen(const boost::asio::ip::tcp::endpoint &at);

    /**
     * Accepts nothing more, ends idle connections, and lets each reply under way be finished.
     *
     * @param finished called, unless the server is gone by then, when no connection is left
     */
    void stop(std::function<void()> finished);

private:
    class state;
    std::shared_ptr<state> state_;
};

} // namespace emulator
