#include "support/quick_server.h"

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <sys/wait.h>

#include <cstdio>

#include "support/bound_socket.h"
#include "support/failure.h"
#include "support/signals_blocked.h"

namespace quillmere_test {

quick_server::quick_server(replier reply_to, server_options options, size_t threads)
    : reply_to_(std::move(reply_to)), options_(std::move(options)),
      stop_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)),
      listener_(listening_socket(options_.address, options_.port))
{
    require(bool(stop_), "eventfd");
    signals_blocked in_new_threads;
    for (size_t each = 0; each < threads; ++each)
        threads_.emplace_back(&quick_server::serve_clients, this);
}

quick_server::~quick_server()
{
    // Stays readable for good, so that every wait of every thread ends.
    ::eventfd_write(stop_.number(), 1);
    for (std::thread &each : threads_)
        each.join();
}

std::string quick_server::base_url() const
{
    return url_of(options_.tls ? "https" : "http", options_.address, options_.port);
}

void quick_server::serve_clients()
{
    for (;;) {
        pollfd waits[] = {{listener_.number(), POLLIN, 0}, {stop_.number(), POLLIN, 0}};
        ::poll(waits, 2, -1);
        if (waits[1].revents)
            return;
        descriptor client(
            ::accept4(listener_.number(), nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
        if (client) // else another thread was quicker
            serve(std::move(client));
    }
}

// True if the reply leaves the connection open for another request.
bool quick_server::answer(connection &peer)
{
    const std::string reply = reply_to_(peer.read_request());
    peer.send(reply);
    return reply.find("\r\nConnection: close\r\n") == std::string::npos;
}

void quick_server::serve(descriptor client)
{
    int yes = 1;
    ::setsockopt(client.number(), IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
    byte_stream stream(std::move(client), stop_.number());
    try {
        if (options_.tls)
            stream.accept_tls(options_.tls.get());
        connection peer(stream, [](const request &) {});
        while (answer(peer))
            continue;
        stream.close();
    } catch (const stream_broken &) {
        // Clients may leave.
    }
}

namespace {

[[noreturn]] void serve_while_needed(const replier &reply_to, const server_options &options,
                                     const descriptor &life, const descriptor &told)
{
    {
        quick_server server(reply_to, options);
        const std::string url = server.base_url();
        ssize_t written = ::write(told.number(), url.data(), url.size());
        pollfd until_closed = {life.number(), 0, 0};
        while (written > 0 && ::poll(&until_closed, 1, -1) != 1) {
        }
    }
    ::_exit(0);
}

} // namespace

quick_server_process::quick_server_process(const replier &reply_to, const server_options &options)
{
    int life[2];
    int told[2];
    require(::pipe(life) == 0 && ::pipe(told) == 0, "pipe");
    descriptor life_reader(life[0]);
    descriptor told_reader(told[0]);
    life_ = descriptor(life[1]);
    descriptor told_writer(told[1]);

    std::fflush(nullptr); // what is buffered is not for the child to write
    pid_ = ::fork();
    require(pid_ >= 0, "fork");
    if (pid_ == 0) {
        life_.reset();
        serve_while_needed(reply_to, options, life_reader, told_writer);
    }

    char url[64];
    ssize_t length = ::read(told_reader.number(), url, sizeof url);
    require(length > 0, "read from the server's process");
    base_url_.assign(url, static_cast<size_t>(length));
}

quick_server_process::~quick_server_process()
{
    life_.reset();
    ::waitpid(pid_, nullptr, 0);
}

} // namespace quillmere_test
