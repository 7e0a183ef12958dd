#include "emulator_admin.h"

#include <stdexcept>

#include <netinet/in.h>
#include <sys/socket.h>

#include "support/descriptor.h"

namespace quillmere_test {

namespace {

descriptor connected_to(std::uint16_t port)
{
    descriptor made(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    const auto *to = reinterpret_cast<const sockaddr *>(&address);
    if (!made || ::connect(made.number(), to, sizeof address) != 0)
        throw std::runtime_error("no connection to the emulator's admin address");
    return made;
}

std::string read_to_end(const descriptor &socket)
{
    std::string all;
    char piece[4096];
    for (ssize_t got; (got = ::recv(socket.number(), piece, sizeof piece, 0)) > 0;)
        all.append(piece, static_cast<std::size_t>(got));
    return all;
}

} // namespace

emulator_admin::emulator_admin(const std::string &url)
    : port_(static_cast<std::uint16_t>(std::stoi(url.substr(url.rfind(':') + 1))))
{
}

int emulator_admin::place(const nlohmann::json &fault) const
{
    return ask("POST", "/faults", fault.dump()).at("id");
}

std::string emulator_admin::counts_of(int fault) const
{
    const nlohmann::json told = ask("GET", "/faults/" + std::to_string(fault));
    return told.at("seen").dump() + " seen, " + told.at("fired").dump() + " fired";
}

nlohmann::json emulator_admin::ask(const std::string &method, const std::string &path,
                                   const std::string &body) const
{
    const descriptor socket = connected_to(port_);
    const std::string request = method + " " + path +
                                " HTTP/1.1\r\nHost: 127.0.0.1\r\nConnection: close\r\n"
                                "Content-Length: " +
                                std::to_string(body.size()) + "\r\n\r\n" + body;
    ::send(socket.number(), request.data(), request.size(), MSG_NOSIGNAL);
    const std::string reply = read_to_end(socket);
    const std::size_t end = reply.find("\r\n\r\n");
    if (end == reply.npos)
        throw std::runtime_error("no reply from the emulator's admin address");
    return nlohmann::json::parse(reply.substr(end + 4));
}

} // namespace quillmere_test
