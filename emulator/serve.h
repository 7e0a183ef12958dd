// The server's life, from the data folder to the signal that ends it.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>

#include "loopback_address.h"

namespace emulator {

struct serve_settings {
    std::filesystem::path data;
    std::uint16_t https_port = 0; // 0 lets the kernel pick
    std::uint16_t http_port = 0;
    std::filesystem::path ready_file; // empty for none
    int ready_descriptor = -1;        // negative for none
    std::int64_t session_lifetime = 600;
    std::optional<loopback_address> admin; // nothing for no admin address
};

/** Returns after SIGINT or SIGTERM. Throws what keeps it from starting. */
void serve(const serve_settings &settings);

} // namespace emulator
