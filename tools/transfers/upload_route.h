// Which way uploads go. The library's upload connection takes TLS on port 443 alone.
#pragma once

#include <string>

#include "../settings.h"

namespace quillmere::tools {

enum class upload_route { tls, plain };

/**
 * Over TLS where the service is on port 443. An emulator on another port is sent them unencrypted,
 * if that does not leave this machine; anything else is a failure.
 */
upload_route upload_route_of(const settings &chosen);

/** Whether the host of an unencrypted base address is this machine itself. */
bool is_on_this_machine(const std::string &plain_base);

} // namespace quillmere::tools
