// The second address, for the test that drives the service: faults, counts and a reset, in JSON.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "faults.h"
#include "http_server.h"
#include "request_counts.h"
#include "service.h"

namespace emulator {

/** What the requests are about. The clients of the service see none of it but the effects. */
struct administered {
    fault_list &faults;
    const request_counts &requests;
    std::function<void()> reset;              // of the trees
    std::function<std::uint64_t()> some_seed; // for a fault that names none
};

/** Serves a request. Whatever happens, the reply is a JSON object. */
reply administer(const request &asked, const administered &state);

/** The handlers of a server for it. */
request_handlers admin_handlers(administered state);

server_limits admin_limits();

} // namespace emulator
