// A server for very many requests: a few threads that answer one client after the other and keep
// nothing of any of them. A reply that does not say "Connection: close" leaves the connection open.
#pragma once

#include <sys/types.h>

#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "support/descriptor.h"
#include "support/scripted_server.h"

namespace quillmere_test {

// Called on several threads at once.
using replier = std::function<std::string(const request &)>;

class quick_server {
public:
    explicit quick_server(replier reply_to, server_options options = {}, size_t threads = 4);
    ~quick_server();
    quick_server(const quick_server &) = delete;
    quick_server &operator=(const quick_server &) = delete;

    std::string base_url() const;

private:
    void serve_clients();
    void serve(descriptor client);
    bool answer(connection &peer);

    replier reply_to_;
    server_options options_;
    descriptor stop_;
    descriptor listener_;
    std::vector<std::thread> threads_;
};

// The same in a process of its own, for a test that measures what its own process holds. To be made
// before the process has threads: a fork takes over locks, but not the threads that hold them.
class quick_server_process {
public:
    explicit quick_server_process(const replier &reply_to, const server_options &options = {});
    ~quick_server_process();
    quick_server_process(const quick_server_process &) = delete;
    quick_server_process &operator=(const quick_server_process &) = delete;

    const std::string &base_url() const { return base_url_; }

private:
    pid_t pid_ = -1;
    descriptor life_; // the server ends when this is closed
    std::string base_url_;
};

} // namespace quillmere_test
