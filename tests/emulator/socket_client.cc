#include "socket_client.h"

#include <cerrno>
#include <stdexcept>

#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>

#include <openssl/ssl.h>
#include <openssl/x509v3.h>

namespace {

emulator::descriptor connect_to(std::uint16_t port, bool ipv6)
{
    emulator::descriptor made(::socket(ipv6 ? AF_INET6 : AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in v4{};
    v4.sin_family = AF_INET;
    v4.sin_port = htons(port);
    v4.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    sockaddr_in6 v6{};
    v6.sin6_family = AF_INET6;
    v6.sin6_port = htons(port);
    v6.sin6_addr = in6addr_loopback;
    const auto *address =
        ipv6 ? reinterpret_cast<const sockaddr *>(&v6) : reinterpret_cast<const sockaddr *>(&v4);
    const socklen_t length = ipv6 ? sizeof v6 : sizeof v4;
    if (made.number() < 0 || ::connect(made.number(), address, length) != 0)
        throw std::runtime_error("connect");
    return made;
}

std::size_t stated_length(const std::string &header)
{
    const std::string field = "Content-Length: ";
    const std::size_t at = header.find(field);
    if (at == std::string::npos)
        throw std::runtime_error("a reply without a length: " + header);
    return std::stoul(header.substr(at + field.size()));
}

std::string get_request(const std::string &target)
{
    return "GET " + target + " HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n\r\n";
}

struct tls_deleter {
    void operator()(SSL_CTX *context) const { SSL_CTX_free(context); }
    void operator()(SSL *session) const { SSL_free(session); }
};

std::unique_ptr<SSL_CTX, tls_deleter> verifying_context(const std::filesystem::path &root)
{
    std::unique_ptr<SSL_CTX, tls_deleter> context(SSL_CTX_new(TLS_client_method()));
    SSL_CTX_set_verify(context.get(), SSL_VERIFY_PEER, nullptr);
    if (SSL_CTX_load_verify_file(context.get(), root.c_str()) != 1)
        throw std::runtime_error("no root certificate");
    return context;
}

void expect_name(SSL *session, const std::string &name)
{
    X509_VERIFY_PARAM *wanted = SSL_get0_param(session);
    if (X509_VERIFY_PARAM_set1_ip_asc(wanted, name.c_str()) != 1)
        X509_VERIFY_PARAM_set1_host(wanted, name.c_str(), name.size());
}

} // namespace

socket_client::socket_client(std::uint16_t port, bool ipv6) : socket_(connect_to(port, ipv6)) {}

void socket_client::send(const std::string &bytes)
{
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const ssize_t done =
            ::send(socket_.number(), bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
        if (done < 0)
            throw std::runtime_error("send");
        sent += static_cast<std::size_t>(done);
    }
}

void socket_client::finish() { ::shutdown(socket_.number(), SHUT_WR); }

bool socket_client::read_piece()
{
    char piece[4096];
    const ssize_t got = ::recv(socket_.number(), piece, sizeof piece, 0);
    was_reset_ = got < 0 && errno == ECONNRESET;
    if (got > 0)
        received_.append(piece, static_cast<std::size_t>(got));
    return got > 0;
}

bool socket_client::is_silent() const
{
    pollfd waiting{socket_.number(), POLLIN, 0};
    return received_.empty() && ::poll(&waiting, 1, 0) == 0;
}

std::string socket_client::read_until(const std::string &text)
{
    while (received_.find(text) == std::string::npos && read_piece()) {
    }
    const std::size_t found = received_.find(text);
    const std::size_t end = found == std::string::npos ? received_.size() : found + text.size();
    std::string taken = received_.substr(0, end);
    received_.erase(0, end);
    return taken;
}

std::string socket_client::read_reply()
{
    const std::string header = read_until("\r\n\r\n");
    const std::size_t length = stated_length(header);
    while (received_.size() < length && read_piece()) {
    }
    std::string reply = header + received_.substr(0, length);
    received_.erase(0, length);
    return reply;
}

std::string socket_client::read_to_end()
{
    while (read_piece()) {
    }
    return std::move(received_);
}

std::string get(std::uint16_t port, const std::string &target)
{
    socket_client client(port);
    client.send(get_request(target));
    return client.read_to_end();
}

std::string ask(std::uint16_t port, const std::string &method, const std::string &target,
                const std::string &body)
{
    socket_client client(port);
    client.send(method + " " + target + " HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n" +
                "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body);
    return client.read_to_end();
}

std::string get_verified(std::uint16_t port, const std::string &target,
                         const std::filesystem::path &root, const std::string &name)
{
    return ask_verified(port, get_request(target), root, name);
}

std::string ask_verified(std::uint16_t port, const std::string &request,
                         const std::filesystem::path &root, const std::string &name)
{
    const emulator::descriptor socket = connect_to(port, name == "::1");
    const auto context = verifying_context(root);
    const std::unique_ptr<SSL, tls_deleter> session(SSL_new(context.get()));
    expect_name(session.get(), name);
    SSL_set_fd(session.get(), socket.number());
    if (SSL_connect(session.get()) != 1)
        throw std::runtime_error(
            X509_verify_cert_error_string(SSL_get_verify_result(session.get())));
    SSL_write(session.get(), request.data(), static_cast<int>(request.size()));
    std::string reply;
    char piece[4096];
    for (int got; (got = SSL_read(session.get(), piece, sizeof piece)) > 0;)
        reply.append(piece, static_cast<std::size_t>(got));
    SSL_shutdown(session.get());
    return reply;
}

std::string element(const std::string &reply, const std::string &name)
{
    const std::string opening = "<" + name + ">";
    const std::size_t begin = reply.find(opening);
    if (begin == std::string::npos)
        return {};
    const std::size_t text = begin + opening.size();
    return reply.substr(text, reply.find("</" + name + ">", text) - text);
}
