#include "http_server.h"

#include <list>
#include <stdexcept>
#include <unordered_set>
#include <utility>
#include <vector>

#include <boost/asio/ip/tcp.hpp>
#include <boost/asio/ip/v6_only.hpp>
#include <boost/asio/steady_timer.hpp>

#include "connection.h"

namespace emulator {
namespace {

namespace asio = boost::asio;
using asio::ip::tcp;

constexpr int port_attempts = 32;

tcp::acceptor open_acceptor(asio::io_context &context, const tcp::endpoint &at)
{
    tcp::acceptor acceptor(context);
    acceptor.open(at.protocol());
    acceptor.set_option(tcp::acceptor::reuse_address(true));
    if (at.protocol() == tcp::v6())
        acceptor.set_option(asio::ip::v6_only(true));
    acceptor.bind(at);
    acceptor.listen();
    return acceptor;
}

bool is_machine_without_ipv6(const boost::system::error_code &problem)
{
    return problem == asio::error::address_family_not_supported ||
           problem == boost::system::errc::address_not_available;
}

std::runtime_error cannot_listen(std::uint16_t port, const boost::system::system_error &why)
{
    return std::runtime_error("cannot listen on port " + std::to_string(port) + ": " +
                              why.code().message());
}

// Clients that resolve "localhost" may try either address, so both must be ours or neither.
std::vector<tcp::acceptor> open_pair(asio::io_context &context, std::uint16_t port)
{
    std::vector<tcp::acceptor> pair;
    pair.push_back(open_acceptor(context, {asio::ip::address_v4::loopback(), port}));
    const std::uint16_t bound = pair.front().local_endpoint().port();
    try {
        pair.push_back(open_acceptor(context, {asio::ip::address_v6::loopback(), bound}));
    } catch (const boost::system::system_error &problem) {
        if (!is_machine_without_ipv6(problem.code()))
            throw;
    }
    return pair;
}

// The kernel picks a port that is free on the first address; on the other it may be taken.
std::vector<tcp::acceptor> open_acceptors(asio::io_context &context, std::uint16_t port)
{
    for (int attempt = 1;; ++attempt) {
        try {
            return open_pair(context, port);
        } catch (const boost::system::system_error &problem) {
            const bool unlucky = port == 0 && problem.code() == asio::error::address_in_use;
            if (!unlucky || attempt == port_attempts)
                throw cannot_listen(port, problem);
        }
    }
}

} // namespace

class http_server::state : public std::enable_shared_from_this<http_server::state> {
public:
    state(asio::io_context &context, const server_limits &limits, request_handlers handlers)
        : context_(context), limits_(limits), handlers_(std::move(handlers))
    {
    }

    std::uint16_t listen(std::uint16_t port, const certificate_choice &tls)
    {
        std::uint16_t bound = port;
        for (tcp::acceptor &acceptor : open_acceptors(context_, port))
            bound = listen(std::move(acceptor), tls);
        return bound;
    }

    std::uint16_t listen(tcp::acceptor acceptor, const certificate_choice &tls)
    {
        const std::uint16_t bound = acceptor.local_endpoint().port();
        listeners_.push_back({std::move(acceptor), asio::steady_timer(context_), tls});
        accept(listeners_.back());
        return bound;
    }

    std::uint16_t listen(const tcp::endpoint &at)
    {
        try {
            return listen(open_acceptor(context_, at), nullptr);
        } catch (const boost::system::system_error &problem) {
            throw cannot_listen(at.port(), problem);
        }
    }

    void stop(std::function<void()> finished)
    {
        stopping_ = true;
        finished_ = std::move(finished);
        for (listener &each : listeners_) {
            each.acceptor.close();
            each.pause.cancel();
        }
        // A copy, because an ended connection removes itself.
        const std::vector<open_connection *> open(open_.begin(), open_.end());
        for (open_connection *each : open)
            each->stop();
        tell_if_finished();
    }

    // From here on connections may end as part of the context's own end, behind the caller's back.
    void forget() { finished_ = nullptr; }

private:
    struct listener {
        tcp::acceptor acceptor;
        asio::steady_timer pause;
        certificate_choice tls; // null for HTTP
        bool waiting = false;   // for a connection to end
    };

    void accept(listener &on)
    {
        on.waiting = open_.size() >= limits_.connections;
        if (on.waiting || stopping_)
            return;
        on.acceptor.async_accept(
            [self = shared_from_this(), &on](beast::error_code problem, tcp::socket socket) {
                if (self->stopping_)
                    return;
                if (problem)
                    return self->accept_later(on);
                self->serve(std::move(socket), on.tls);
                self->accept(on);
            });
    }

    // Most likely out of descriptors; asking again at once would only burn time.
    void accept_later(listener &on)
    {
        on.pause.expires_after(std::chrono::milliseconds(100));
        on.pause.async_wait([self = shared_from_this(), &on](beast::error_code cancelled) {
            if (!cancelled)
                self->accept(on);
        });
    }

    void serve(tcp::socket socket, const certificate_choice &tls)
    {
        beast::error_code problem;
        const tcp::endpoint client = socket.remote_endpoint(problem);
        if (problem || !client.address().is_loopback())
            return;
        socket.set_option(tcp::no_delay(true), problem);
        beast::tcp_stream stream(std::move(socket));
        if (tls)
            start<asio::ssl::stream<beast::tcp_stream>>(std::move(stream), tls());
        else
            start<beast::tcp_stream>(std::move(stream));
    }

    template <class Stream, class... Parts> void start(Parts &&...parts)
    {
        auto closed = [self = shared_from_this()](open_connection *which) { self->closed(which); };
        const auto made = std::make_shared<connection<Stream>>(
            connection_host{limits_, handlers_, std::move(closed)}, std::forward<Parts>(parts)...);
        open_.insert(made.get());
        made->start();
    }

    void closed(open_connection *which)
    {
        open_.erase(which);
        if (stopping_)
            return tell_if_finished();
        for (listener &each : listeners_)
            if (each.waiting)
                accept(each);
    }

    void tell_if_finished()
    {
        if (open_.empty() && finished_)
            std::exchange(finished_, nullptr)();
    }

    asio::io_context &context_;
    server_limits limits_;
    request_handlers handlers_;
    std::list<listener> listeners_; // a list, because accepting holds on to its element
    std::unordered_set<open_connection *> open_;
    std::function<void()> finished_;
    bool stopping_ = false;
};

http_server::http_server(asio::io_context &context, const server_limits &limits,
                         request_handlers handlers)
    : state_(std::make_shared<state>(context, limits, std::move(handlers)))
{
}

http_server::~http_server() { state_->forget(); }

std::uint16_t http_server::listen(std::uint16_t port, const certificate_choice &tls)
{
    return state_->listen(port, tls);
}

std::uint16_t http_server::listen(const tcp::endpoint &at) { return state_->listen(at); }

void http_server::stop(std::function<void()> finished) { state_->stop(std::move(finished)); }

} // namespace emulator
