// A relay on the loopback interface between a client and a server, which cuts connections where a
// test wants it.
#pragma once

#include <cstdint>
#include <list>
#include <mutex>
#include <thread>

#include "support/descriptor.h"

namespace quillmere_test {

enum class way { to_server, to_client };

class cutting_relay {
public:
    explicit cutting_relay(uint16_t server_port);
    ~cutting_relay();
    cutting_relay(const cutting_relay &) = delete;
    cutting_relay &operator=(const cutting_relay &) = delete;

    uint16_t port() const { return port_; }

    // Connections from now on end, on both sides, when so many bytes have gone this way.
    void cut_after(way which, uint64_t bytes);
    void cut_nothing();

    // How many connections were cut.
    size_t cuts() const;

private:
    struct limit {
        bool set = false;
        way which = way::to_client;
        uint64_t bytes = 0;
    };

    void accept_clients();
    void relay(descriptor client, limit most);

    uint16_t server_port_;
    descriptor listener_;
    descriptor stop_; // readable when it is time to end
    uint16_t port_ = 0;

    mutable std::mutex mutex_; // guards the rest but the acceptor
    limit limit_;
    size_t cuts_ = 0;
    std::list<std::thread> relays_;
    std::thread acceptor_;
};

} // namespace quillmere_test
