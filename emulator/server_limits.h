// How much the server takes, and how long it waits.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>

namespace emulator {

struct server_limits {
    std::uint32_t header_bytes = 64 * 1024; // the target with its query included
    std::uint64_t body_bytes = 1024 * 1024;
    std::size_t connections = 256;          // further ones wait in the kernel's queue
    std::chrono::seconds exchange_time{30}; // for a handshake, a request, a reply
    std::chrono::seconds idle_time{60};     // between two requests of one connection
};

} // namespace emulator
