// Tells whoever started the emulator that it listens, and where.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>

#include "loopback_address.h"

namespace emulator {

struct listening_at {
    std::uint16_t https_port;
    std::uint16_t http_port;
    std::filesystem::path root_certificate;
    std::optional<loopback_address> admin = {};

    std::string https_url() const;
    std::string http_url() const;
};

/** One JSON object on one line. */
std::string ready_line(const listening_at &where);

/** The ready file and descriptor; either may be unset. */
class ready_signal {
public:
    /** Removes a file that an earlier run has left, lest somebody take it for this one's. */
    ready_signal(std::filesystem::path file, int descriptor);
    /** Removes the file: what does not exist must not promise a server. */
    ~ready_signal();
    ready_signal(const ready_signal &) = delete;
    ready_signal &operator=(const ready_signal &) = delete;

    /** The file appears whole; the descriptor gets the line and is closed. */
    void give(const listening_at &where);

private:
    std::filesystem::path file_; // empty for none
    int descriptor_;             // negative for none
};

} // namespace emulator
