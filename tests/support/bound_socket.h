// Sockets of servers on the loopback interface, and the addresses that lead to them.
#pragma once

#include <cstdint>
#include <string>

#include "support/descriptor.h"

namespace quillmere_test {

// A non-blocking socket bound to the port, or to one that the kernel picks for 0; port receives it.
descriptor bound_socket(const std::string &address, uint16_t &port);

// The same, listening.
descriptor listening_socket(const std::string &address, uint16_t &port);

// What connect() says to such a socket, errno included.
int connect_to(const descriptor &socket, const std::string &address, uint16_t port);

// Such as "https://127.0.0.1:40001", without a trailing slash.
std::string url_of(const std::string &scheme, const std::string &host, uint16_t port);

} // namespace quillmere_test
