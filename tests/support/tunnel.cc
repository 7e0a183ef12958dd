#include "support/tunnel.h"

#include <netinet/in.h>
#include <sys/socket.h>

#include <array>
#include <thread>

#include "support/descriptor.h"
#include "support/failure.h"

namespace quillmere_test {
namespace {

descriptor connected_to(uint16_t port)
{
    descriptor socket(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    require(::connect(socket.number(), reinterpret_cast<sockaddr *>(&address), sizeof address) == 0,
            "connect");
    return socket;
}

void carry_down(const descriptor &service, connection &client)
{
    std::array<char, 16384> bytes;
    ssize_t count;
    while ((count = ::recv(service.number(), bytes.data(), bytes.size(), 0)) > 0)
        client.send({bytes.data(), static_cast<size_t>(count)});
}

void carry_up(connection &client, const descriptor &service)
{
    std::string bytes;
    while (!(bytes = client.read_some()).empty())
        if (::send(service.number(), bytes.data(), bytes.size(), MSG_NOSIGNAL) < 0)
            return;
}

} // namespace

connection_script tunnelling_to(uint16_t port)
{
    return [port](connection &client) {
        client.read_request();
        descriptor service = connected_to(port);
        client.send("HTTP/1.1 200 Connection established\r\n\r\n");
        auto until_broken = [](auto carry) {
            try {
                carry();
            } catch (const stream_broken &) {
            }
        };
        std::thread down([&] { until_broken([&] { carry_down(service, client); }); });
        until_broken([&] { carry_up(client, service); });
        ::shutdown(service.number(), SHUT_RDWR);
        down.join();
    };
}

} // namespace quillmere_test
