#include "support/scripted_server.h"

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <openssl/ssl.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>

#include <cstring>

#include "support/bound_socket.h"
#include "support/failure.h"
#include "support/signals_blocked.h"

namespace quillmere_test {

server_options tls_with(const certificate &leaf)
{
    server_options options;
    options.tls.reset(SSL_CTX_new(TLS_server_method()), SSL_CTX_free);
    SSL_CTX *context = options.tls.get();
    if (!context || SSL_CTX_use_certificate(context, leaf.x509()) != 1 ||
        SSL_CTX_use_PrivateKey(context, leaf.key()) != 1)
        throw std::runtime_error("no TLS server with this certificate");
    SSL_CTX_set_mode(context, SSL_MODE_ENABLE_PARTIAL_WRITE | SSL_MODE_ACCEPT_MOVING_WRITE_BUFFER);
    // Clients that go away without a close_notify have ended; that is no failure of ours.
    SSL_CTX_set_options(context, SSL_OP_IGNORE_UNEXPECTED_EOF);
    return options;
}

server_options on_address(std::string address, server_options options)
{
    options.address = std::move(address);
    return options;
}

server_options on_port(uint16_t port, server_options options)
{
    options.port = port;
    return options;
}

std::string address_of_this_process()
{
    // All of 127.0.0.0/8 is the loopback interface's. Process numbers have 22 bits at most.
    auto number = static_cast<unsigned>(::getpid());
    return "127." + std::to_string(128 + (number >> 16 & 0x7f)) + "." +
           std::to_string(number >> 8 & 0xff) + "." + std::to_string(number & 0xff);
}

scripted_server::scripted_server(server_options options)
    : options_(std::move(options)), port_(options_.port)
{
    answer(http_reply(500, "the test gave this server no script"));
    stop_ = descriptor(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK));
    require(bool(stop_), "eventfd");
    listener_ = listening_socket(options_.address, port_);
    signals_blocked in_new_threads;
    acceptor_ = std::thread(&scripted_server::accept_clients, this);
}

scripted_server::~scripted_server()
{
    {
        std::lock_guard<std::mutex> lock(mutex_);
        stopping_ = true;
    }
    changed_.notify_all();
    // Stays readable for good, so that every wait of every thread ends.
    ::eventfd_write(stop_.number(), 1);
    acceptor_.join();
    for (worker &each : workers_)
        each.thread.join();
}

void scripted_server::answer_with(std::function<std::string(const request &)> reply_to)
{
    script(answering_with(std::move(reply_to)));
}

void scripted_server::next(std::vector<connection_script> scripts)
{
    std::lock_guard<std::mutex> lock(mutex_);
    scripts_.assign(scripts.begin(), scripts.end());
}

std::string scripted_server::base_url() const { return base_url(options_.address); }

std::string scripted_server::base_url(const std::string &host) const
{
    return url_of(is_tls() ? "https" : "http", host, port_);
}

std::vector<request> scripted_server::requests() const
{
    std::lock_guard<std::mutex> lock(mutex_);
    return requests_;
}

size_t scripted_server::connections() const
{
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait_for(lock, patience, [this] { return stopping_ || !somebody_knocks(); });
    return connections_;
}

bool scripted_server::somebody_knocks() const
{
    pollfd wait = {listener_.number(), POLLIN, 0};
    return ::poll(&wait, 1, 0) > 0;
}

size_t scripted_server::handshake_failures() const
{
    std::lock_guard<std::mutex> lock(mutex_);
    return handshake_failures_;
}

template <class Condition> bool scripted_server::wait_until(Condition condition)
{
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait_for(lock, patience, [&] { return stopping_ || condition(); });
    return condition();
}

bool scripted_server::wait_for_connections(size_t count)
{
    return wait_until([&] { return connections_ >= count; });
}

bool scripted_server::wait_for_requests(size_t count)
{
    return wait_until([&] { return requests_.size() >= count; });
}

bool scripted_server::wait_for_handshake_failures(size_t count)
{
    return wait_until([&] { return handshake_failures_ >= count; });
}

bool scripted_server::wait_until_idle()
{
    bool idle = wait_until([&] {
        for (const worker &each : workers_)
            if (!each.finished)
                return false;
        return !somebody_knocks();
    });
    join_finished();
    return idle;
}

void scripted_server::accept_clients()
{
    for (;;) {
        pollfd waits[] = {{listener_.number(), POLLIN, 0}, {stop_.number(), POLLIN, 0}};
        ::poll(waits, 2, -1);
        if (waits[1].revents)
            return;
        // Thousands of connections must not leave thousands of threads behind.
        join_finished();
        take_client();
    }
}

// A client is counted as soon as it no longer waits at the listener, so that it is seen at one of
// the two places at any moment.
void scripted_server::take_client()
{
    {
        std::lock_guard<std::mutex> lock(mutex_);
        int kind = SOCK_NONBLOCK | SOCK_CLOEXEC;
        descriptor socket(::accept4(listener_.number(), nullptr, nullptr, kind));
        if (!socket)
            return;
        int yes = 1;
        ::setsockopt(socket.number(), IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
        ++connections_;
        worker &own = workers_.emplace_back();
        own.thread = std::thread(
            [this, &own, script = take_script()](descriptor client) {
                serve(std::move(client), script);
                finish(own);
            },
            std::move(socket));
    }
    changed_.notify_all();
}

connection_script scripted_server::take_script()
{
    connection_script script = scripts_.front();
    if (scripts_.size() > 1)
        scripts_.pop_front();
    return script;
}

void scripted_server::serve(descriptor socket, const connection_script &script)
{
    byte_stream stream(std::move(socket), stop_.number());
    bool greeted = !is_tls();
    try {
        if (is_tls())
            stream.accept_tls(options_.tls.get());
        greeted = true;
        connection client(stream, [this](const request &arrived) {
            {
                std::lock_guard<std::mutex> lock(mutex_);
                requests_.push_back(arrived);
            }
            changed_.notify_all();
        });
        script(client);
        stream.close();
    } catch (const stream_broken &) {
        if (greeted)
            return;
        std::lock_guard<std::mutex> lock(mutex_);
        ++handshake_failures_;
    } catch (const std::exception &failure) {
        ADD_FAILURE() << "a script has failed: " << failure.what();
    }
}

void scripted_server::finish(worker &own)
{
    // Told under the lock: a server that is being destroyed joins this thread first.
    std::lock_guard<std::mutex> lock(mutex_);
    own.finished = true;
    changed_.notify_all();
}

void scripted_server::join_finished()
{
    std::list<worker> finished;
    {
        std::lock_guard<std::mutex> lock(mutex_);
        for (auto each = workers_.begin(); each != workers_.end();) {
            auto current = each++;
            if (current->finished)
                finished.splice(finished.end(), workers_, current);
        }
    }
    for (worker &each : finished)
        each.thread.join();
}

refused_port::refused_port() : port_(0)
{
    // Bound, so that nobody else can get the port, but never listening.
    socket_ = bound_socket("127.0.0.1", port_);
}

std::string refused_port::base_url(const std::string &scheme) const
{
    return url_of(scheme, "127.0.0.1", port_);
}

full_port::full_port() : port_(0)
{
    socket_ = bound_socket("127.0.0.1", port_);
    require(::listen(socket_.number(), 0) == 0, "listen");
    while (takes_another())
        continue;
}

bool full_port::takes_another()
{
    constexpr int long_on_loopback = 200; // milliseconds
    uint16_t any_port = 0;
    descriptor &client = waiting_.emplace_back(bound_socket("127.0.0.1", any_port));
    if (connect_to(client, "127.0.0.1", port_) == 0)
        return true;
    require(errno == EINPROGRESS, "connect");
    pollfd wait = {client.number(), POLLOUT, 0};
    return ::poll(&wait, 1, long_on_loopback) > 0;
}

std::string full_port::base_url(const std::string &scheme) const
{
    return url_of(scheme, "127.0.0.1", port_);
}

} // namespace quillmere_test
