// A server on the loopback interface that does to its clients, byte for byte, what a test tells it
// to: good answers, cut-off ones, resets, silence.
//
//     scripted_server server;                      // or server(tls_with(loopback_certificate()))
//     server.answer(xml_reply("<response/>"));
//     server.next({resetting(), answering(http_reply(500, ""))});
//     server.script([](connection &client) {
//         client.read_request();
//         client.send("HTTP/1.1 200 OK\r\nContent-Le");
//         client.reset();
//     });
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <list>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "support/byte_stream.h"
#include "support/certificates.h"
#include "support/http_message.h"

namespace quillmere_test {

// What a script holds of one client. A step that can no longer be done (the client is gone, the
// server stops) ends the script by an exception that the server expects.
class connection {
public:
    using recorder = std::function<void(const request &)>;
    connection(byte_stream &stream, recorder record);

    // The next request with its body, if it announces one by Content-Length.
    request read_request();

    // Bytes as they come, for what is no request; none at the end.
    std::string read_some();

    void send(std::string_view bytes) { stream_.write(bytes); }

    // Sends every piece in a segment, and a TLS record, of its own.
    void send_in_pieces(std::string_view bytes, size_t piece);

    // Sends the piece again and again, with pauses, until the client gives up.
    void send_until_closed(std::string_view piece, std::chrono::milliseconds pause);

    // A clean end, which is also what happens after a script's last step.
    void close() { stream_.close(); }
    void reset() { stream_.reset(); }

    // Says nothing until the client closes, or the server stops.
    void stall() { stream_.wait_for_peer_close(); }
    void wait_for_peer_close() { stream_.wait_for_peer_close(); }

private:
    bool read_more();

    byte_stream &stream_;
    recorder record_;
    std::string unread_;
};

using connection_script = std::function<void(connection &)>;

connection_script answering(std::string reply);
connection_script answering_with(std::function<std::string(const request &)> reply_to);
connection_script closing();   // reads the request and closes without an answer
connection_script resetting(); // reads the request and resets the connection
connection_script stalling();  // reads the request and never answers

struct server_options {
    std::shared_ptr<SSL_CTX> tls; // none: a plain server
    std::string address = "127.0.0.1";
    uint16_t port = 0; // 0: one that the kernel picks
};

server_options tls_with(const certificate &leaf);
server_options on_address(std::string address, server_options options = {});

// For what always goes to one port. An address of the test process's own keeps tests that run at
// the same time apart.
server_options on_port(uint16_t port, server_options options = {});
std::string address_of_this_process();

class scripted_server {
public:
    explicit scripted_server(server_options options = {});
    ~scripted_server();
    scripted_server(const scripted_server &) = delete;
    scripted_server &operator=(const scripted_server &) = delete;

    // What the connections from now on get. Without any of these a client gets status 500.
    void answer(std::string reply) { script(answering(std::move(reply))); }
    void answer_with(std::function<std::string(const request &)> reply_to);
    void script(connection_script script) { next({std::move(script)}); }

    // One script for each connection, in the order in which they are accepted; the last repeats.
    void next(std::vector<connection_script> scripts);

    uint16_t port() const { return port_; }
    bool is_tls() const { return options_.tls != nullptr; }

    // Such as "https://127.0.0.1:40001", without a trailing slash.
    std::string base_url() const;
    std::string base_url(const std::string &host) const;

    std::vector<request> requests() const;

    // Every client counts that has reached the listener, even if it left at once.
    size_t connections() const;

    // A client that dislikes the name alone, not the chain, may finish the handshake and leave
    // then.
    size_t handshake_failures() const;

    // False if it did not happen within the tests' patience. wait_until_idle waits until no
    // connection is left, their threads and descriptors included.
    bool wait_for_connections(size_t count);
    bool wait_for_requests(size_t count);
    bool wait_for_handshake_failures(size_t count);
    bool wait_until_idle();

private:
    struct worker {
        std::thread thread;
        bool finished = false;
    };

    void listen();
    void accept_clients();
    void take_client();
    bool somebody_knocks() const;
    void serve(descriptor socket, const connection_script &script);
    connection_script take_script();
    void finish(worker &own);
    void join_finished();
    template <class Condition> bool wait_until(Condition condition);

    server_options options_;
    descriptor listener_;
    descriptor stop_;
    uint16_t port_;

    mutable std::mutex mutex_; // guards everything below but the acceptor
    mutable std::condition_variable changed_;
    bool stopping_ = false;
    std::deque<connection_script> scripts_;
    std::vector<request> requests_;
    size_t connections_ = 0;
    size_t handshake_failures_ = 0;
    std::list<worker> workers_;
    std::thread acceptor_;
};

// A port of the loopback interface that refuses connections as long as the object lives.
class refused_port {
public:
    refused_port();

    uint16_t port() const { return port_; }
    std::string base_url(const std::string &scheme = "http") const;

private:
    descriptor socket_;
    uint16_t port_;
};

// A port of the loopback interface that listens, but lets no further connection come about: its
// queue is full, and nobody takes anything out of it.
class full_port {
public:
    full_port();

    std::string base_url(const std::string &scheme = "http") const;

private:
    bool takes_another();

    descriptor socket_;
    std::vector<descriptor> waiting_;
    uint16_t port_;
};

} // namespace quillmere_test
