#include "support/cutting_relay.h"

#include <algorithm>
#include <vector>

#include <netinet/in.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>

#include "support/failure.h"

namespace quillmere_test {

namespace {

constexpr size_t piece_bytes = 64 * 1024;

sockaddr_in loopback(uint16_t port)
{
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    return address;
}

descriptor make_socket() { return descriptor(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)); }

uint16_t bind_and_listen(const descriptor &socket)
{
    sockaddr_in address = loopback(0);
    socklen_t length = sizeof address;
    auto *where = reinterpret_cast<sockaddr *>(&address);
    require(::bind(socket.number(), where, length) == 0, "bind");
    require(::listen(socket.number(), SOMAXCONN) == 0, "listen");
    require(::getsockname(socket.number(), where, &length) == 0, "getsockname");
    return ntohs(address.sin_port);
}

bool connected(const descriptor &socket, uint16_t port)
{
    const sockaddr_in address = loopback(port);
    return ::connect(socket.number(), reinterpret_cast<const sockaddr *>(&address),
                     sizeof address) == 0;
}

bool send_all(int socket, const char *bytes, size_t count)
{
    while (count > 0) {
        const ssize_t sent = ::send(socket, bytes, count, MSG_NOSIGNAL);
        if (sent <= 0)
            return false;
        bytes += sent;
        count -= static_cast<size_t>(sent);
    }
    return true;
}

} // namespace

cutting_relay::cutting_relay(uint16_t server_port)
    : server_port_(server_port), listener_(make_socket()), stop_(::eventfd(0, EFD_CLOEXEC))
{
    require(listener_ && stop_, "socket");
    port_ = bind_and_listen(listener_);
    acceptor_ = std::thread([this] { accept_clients(); });
}

cutting_relay::~cutting_relay()
{
    ::eventfd_write(stop_.number(), 1);
    acceptor_.join();
    for (std::thread &each : relays_)
        each.join();
}

void cutting_relay::cut_after(way which, uint64_t bytes)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    limit_ = {true, which, bytes};
}

void cutting_relay::cut_nothing()
{
    const std::lock_guard<std::mutex> lock(mutex_);
    limit_ = {};
}

size_t cutting_relay::cuts() const
{
    const std::lock_guard<std::mutex> lock(mutex_);
    return cuts_;
}

void cutting_relay::accept_clients()
{
    for (;;) {
        pollfd waited[] = {{listener_.number(), POLLIN, 0}, {stop_.number(), POLLIN, 0}};
        ::poll(waited, 2, -1);
        if (waited[1].revents != 0)
            return;
        descriptor client(::accept4(listener_.number(), nullptr, nullptr, SOCK_CLOEXEC));
        const std::lock_guard<std::mutex> lock(mutex_);
        relays_.emplace_back([this, most = limit_, socket = std::move(client)]() mutable {
            relay(std::move(socket), most);
        });
    }
}

// Two pipes side by side. Neither end of a connection sends much while the other does, so that one
// may wait for the other.
void cutting_relay::relay(descriptor client, limit most)
{
    descriptor server = make_socket();
    if (!connected(server, server_port_))
        return;
    struct pipe {
        int from;
        int to;
        uint64_t left;
        bool open = true;
    };
    const auto room = [&most](way which) {
        return most.set && most.which == which ? most.bytes : UINT64_MAX;
    };
    pipe pipes[] = {{client.number(), server.number(), room(way::to_server)},
                    {server.number(), client.number(), room(way::to_client)}};
    std::vector<char> piece(piece_bytes);
    while (pipes[0].open || pipes[1].open) {
        pollfd waited[] = {{pipes[0].open ? pipes[0].from : -1, POLLIN, 0},
                           {pipes[1].open ? pipes[1].from : -1, POLLIN, 0},
                           {stop_.number(), POLLIN, 0}};
        ::poll(waited, 3, -1);
        if (waited[2].revents != 0)
            return;
        for (size_t which = 0; which < 2; ++which) {
            pipe &each = pipes[which];
            if (waited[which].revents == 0)
                continue;
            const ssize_t got = ::recv(each.from, piece.data(), piece.size(), 0);
            if (got < 0)
                return;
            each.open = got > 0;
            if (!each.open)
                ::shutdown(each.to, SHUT_WR);
            const auto passed = std::min(static_cast<uint64_t>(got), each.left);
            each.left -= passed;
            if (!send_all(each.to, piece.data(), static_cast<size_t>(passed)))
                return;
            if (each.left == 0) {
                const std::lock_guard<std::mutex> lock(mutex_);
                ++cuts_;
                return;
            }
        }
    }
}

} // namespace quillmere_test
