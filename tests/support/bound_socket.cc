#include "support/bound_socket.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <stdexcept>

#include "support/failure.h"

namespace quillmere_test {
namespace {

struct loopback_address {
    sockaddr_storage storage = {};
    socklen_t length = 0;

    explicit loopback_address(const std::string &text)
    {
        auto v4 = reinterpret_cast<sockaddr_in *>(&storage);
        auto v6 = reinterpret_cast<sockaddr_in6 *>(&storage);
        if (inet_pton(AF_INET, text.c_str(), &v4->sin_addr) == 1) {
            storage.ss_family = AF_INET;
            length = sizeof *v4;
        } else if (inet_pton(AF_INET6, text.c_str(), &v6->sin6_addr) == 1) {
            storage.ss_family = AF_INET6;
            length = sizeof *v6;
        } else {
            throw std::invalid_argument("no address: " + text);
        }
    }
    // The port stands at the same place in both families.
    uint16_t port() const
    {
        return ntohs(reinterpret_cast<const sockaddr_in *>(&storage)->sin_port);
    }
    void take(uint16_t wanted)
    {
        reinterpret_cast<sockaddr_in *>(&storage)->sin_port = htons(wanted);
    }
    sockaddr *generic() { return reinterpret_cast<sockaddr *>(&storage); }
};

} // namespace

descriptor bound_socket(const std::string &text, uint16_t &port)
{
    loopback_address address(text);
    int kind = SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC;
    descriptor socket(::socket(address.storage.ss_family, kind, 0));
    require(bool(socket), "socket");
    address.take(port);
    int yes = 1; // a port that was chosen must not stay taken by a connection that has ended
    if (port != 0)
        ::setsockopt(socket.number(), SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
    require(::bind(socket.number(), address.generic(), address.length) == 0, "bind " + text);
    require(::getsockname(socket.number(), address.generic(), &address.length) == 0, "getsockname");
    port = address.port();
    return socket;
}

descriptor listening_socket(const std::string &address, uint16_t &port)
{
    descriptor socket = bound_socket(address, port);
    require(::listen(socket.number(), SOMAXCONN) == 0, "listen");
    return socket;
}

int connect_to(const descriptor &socket, const std::string &text, uint16_t port)
{
    loopback_address address(text);
    address.take(port);
    return ::connect(socket.number(), address.generic(), address.length);
}

std::string url_of(const std::string &scheme, const std::string &host, uint16_t port)
{
    bool bare_v6 = host.find(':') != std::string::npos && host[0] != '[';
    return scheme + "://" + (bare_v6 ? "[" + host + "]" : host) + ":" + std::to_string(port);
}

} // namespace quillmere_test
