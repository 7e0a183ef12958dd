// A proxy for the scripted server: the tunnel behind CONNECT.
#pragma once

#include <cstdint>

#include "support/scripted_server.h"

namespace quillmere_test {

// What a real proxy does for CONNECT, to whatever place: it connects to a loopback port, and
// carries bytes both ways until either side has enough.
connection_script tunnelling_to(uint16_t port);

} // namespace quillmere_test
