#include "support/byte_stream.h"

#include <openssl/err.h>
#include <openssl/ssl.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>

namespace quillmere_test {
namespace {

constexpr size_t piece = 64 * 1024;
constexpr int for_ever = -1;

bool would_block() { return errno == EAGAIN || errno == EWOULDBLOCK; }

} // namespace

byte_stream::byte_stream(descriptor socket, int stop)
    : socket_(std::move(socket)), stop_(stop), tls_(nullptr, SSL_free)
{
}

byte_stream::~byte_stream() = default;

void byte_stream::accept_tls(SSL_CTX *context)
{
    tls_.reset(SSL_new(context));
    if (!tls_ || SSL_set_fd(tls_.get(), socket_.number()) != 1)
        throw stream_broken("no TLS session");
    for (int result = 0; result != 1;) {
        ERR_clear_error();
        result = SSL_accept(tls_.get());
        if (result != 1)
            wait_for_tls(result);
    }
}

std::string byte_stream::read_some() { return tls_ ? receive_tls() : receive_plain(); }

void byte_stream::write(std::string_view bytes)
{
    while (!bytes.empty())
        bytes.remove_prefix(transmit(bytes));
}

void byte_stream::close()
{
    if (!socket_)
        return;
    if (tls_)
        SSL_shutdown(tls_.get());
    ::shutdown(socket_.number(), SHUT_WR);
    // Closing with unread bytes would send a reset, which may overtake what was written.
    discard_until_peer_closes();
    socket_.reset();
}

void byte_stream::reset()
{
    linger at_once = {1, 0};
    ::setsockopt(socket_.number(), SOL_SOCKET, SO_LINGER, &at_once, sizeof at_once);
    socket_.reset();
}

bool byte_stream::peer_closes_within(std::chrono::milliseconds time)
{
    return wait_for(POLLRDHUP, static_cast<int>(time.count()));
}

void byte_stream::wait_for_peer_close() { wait_for(POLLRDHUP); }

void byte_stream::wait_for(short events) { wait_for(events, for_ever); }

bool byte_stream::wait_for(short events, int milliseconds)
{
    if (!socket_)
        throw stream_broken("the script has closed this connection");
    pollfd waits[] = {{socket_.number(), events, 0}, {stop_, POLLIN, 0}};
    int ready = ::poll(waits, 2, milliseconds);
    if (waits[1].revents)
        throw stream_broken("the server stops");
    return ready > 0;
}

void byte_stream::wait_for_tls(int result)
{
    switch (SSL_get_error(tls_.get(), result)) {
    case SSL_ERROR_WANT_READ:
        return wait_for(POLLIN);
    case SSL_ERROR_WANT_WRITE:
        return wait_for(POLLOUT);
    default:
        // OpenSSL must not be asked to say goodbye on a session that has failed.
        tls_.reset();
        throw stream_broken("TLS failed");
    }
}

std::string byte_stream::receive_plain()
{
    std::array<char, piece> bytes;
    for (;;) {
        wait_for(POLLIN);
        ssize_t count = ::recv(socket_.number(), bytes.data(), bytes.size(), 0);
        if (count >= 0)
            return std::string(bytes.data(), static_cast<size_t>(count));
        if (!would_block() && errno != EINTR)
            throw stream_broken("the peer has reset the connection");
    }
}

std::string byte_stream::receive_tls()
{
    std::array<char, piece> bytes;
    for (;;) {
        if (!socket_)
            throw stream_broken("the script has closed this connection");
        ERR_clear_error();
        int count = SSL_read(tls_.get(), bytes.data(), static_cast<int>(bytes.size()));
        if (count > 0)
            return std::string(bytes.data(), static_cast<size_t>(count));
        if (SSL_get_error(tls_.get(), count) == SSL_ERROR_ZERO_RETURN)
            return {};
        wait_for_tls(count);
    }
}

size_t byte_stream::transmit(std::string_view bytes)
{
    if (!socket_)
        throw stream_broken("the script has closed this connection");
    if (tls_) {
        ERR_clear_error();
        int length = static_cast<int>(std::min<size_t>(bytes.size(), INT_MAX));
        int count = SSL_write(tls_.get(), bytes.data(), length);
        if (count > 0)
            return static_cast<size_t>(count);
        wait_for_tls(count);
        return 0;
    }
    ssize_t count = ::send(socket_.number(), bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (count >= 0)
        return static_cast<size_t>(count);
    if (!would_block() && errno != EINTR)
        throw stream_broken("the peer takes no more");
    wait_for(POLLOUT);
    return 0;
}

void byte_stream::discard_until_peer_closes()
{
    std::array<char, piece> bytes;
    for (;;) {
        wait_for(POLLIN);
        ssize_t count = ::recv(socket_.number(), bytes.data(), bytes.size(), 0);
        if (count == 0 || (count < 0 && !would_block() && errno != EINTR))
            return;
    }
}

} // namespace quillmere_test
