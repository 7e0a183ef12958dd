// One accepted connection as a stream of bytes, plain or TLS. Every wait also ends when the server
// stops, so that no client, however it behaves, can hold a test up.
#pragma once

#include <openssl/types.h>

#include <chrono>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>

#include "support/descriptor.h"

namespace quillmere_test {

// The peer is gone, or the server stops: what the script had planned cannot go on.
struct stream_broken : std::runtime_error {
    using std::runtime_error::runtime_error;
};

class byte_stream {
public:
    // Takes a non-blocking socket. stop becomes readable when the server stops.
    byte_stream(descriptor socket, int stop);
    ~byte_stream();

    // Makes this a TLS stream. Fails with stream_broken when the client does not like us.
    void accept_tls(SSL_CTX *context);

    // Some bytes, at least one; none when the peer has ended its side.
    std::string read_some();
    void write(std::string_view bytes);

    // Ends our side cleanly, with close_notify and FIN, and waits for the peer to end its own.
    void close();

    // Ends the stream with a TCP reset, without a word in TLS.
    void reset();

    // Waits, reading nothing, until the peer closes. False if that did not happen in time.
    bool peer_closes_within(std::chrono::milliseconds time);
    void wait_for_peer_close();

private:
    void wait_for(short events);
    bool wait_for(short events, int milliseconds);
    void wait_for_tls(int result);
    std::string receive_plain();
    std::string receive_tls();
    size_t transmit(std::string_view bytes);
    void discard_until_peer_closes();

    descriptor socket_;
    int stop_;
    std::unique_ptr<SSL, void (*)(SSL *)> tls_;
};

} // namespace quillmere_test
