// One exchange with a service, taken apart: how far it came, how long each part took, and with what
// certificate the service showed itself.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

#include "../settings.h"

namespace quillmere::tools {

enum class stage { lookup, connection, handshake, answer };

struct service_certificate {
    std::string subject;
    std::string issuer;
    std::string expires;
};

struct connection_probe {
    stage reached = stage::lookup; ///< the last one that was begun
    int code = 0;                  ///< of libcurl; 0 when all of them went well
    std::string problem;           ///< the failure in the transport's words
    std::string address;           ///< and port that it was connected to; empty if to none
    long http_status = 0;
    std::optional<service_certificate> certificate;
    /** What the service's clock shows ahead of this machine's, if it told the time. */
    std::optional<std::chrono::seconds> clock_ahead;

    /** How long a stage took that was passed. */
    std::optional<std::chrono::microseconds> time_of(stage which) const;
    bool passed(stage which) const;

    std::chrono::microseconds ended[4] = {}; ///< since the beginning, by stage
};

/** Asks for the head of the service's base address. The library has to be started. */
connection_probe probe_connection(const settings &chosen);

} // namespace quillmere::tools
