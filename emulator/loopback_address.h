// An address of this machine alone, as it is given on the command line.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace emulator {

struct loopback_address {
    std::string host; // 127.0.0.1 or ::1, or another number of loopback
    std::uint16_t port = 0;

    /** "http://127.0.0.1:4711", "http://[::1]:4711" */
    std::string http_url() const;
};

/** Reads "127.0.0.1:0" or "[::1]:0". Nothing for what is another machine's, or no address. */
std::optional<loopback_address> parse_loopback_address(const std::string &text);

} // namespace emulator
