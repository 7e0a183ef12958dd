// The ways in which a program can come upon a fault: a GET, a POST, an operation.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

#include "faults/fault.h"
#include "transport/exchange.h"

namespace quillmere_test {

struct outcome_of_call {
    exchange exchanged; // of a GET or a POST
    int32_t status = 0; // of an operation, and what it hands out
    std::optional<std::string> message;
    bool handed_out = false;
    std::string log;
    int64_t blocks_kept = 0; // of the library's, by this thread
    std::chrono::steady_clock::duration time;
};

struct way {
    const char *name;
    outcome_of_call (*call)(const std::string &base);

    // What the call returns, and what it logs but for the failures of the exchange, which stand
    // between the two parts.
    void (*check)(const outcome_of_call &outcome, const expectation &expected, bool succeeded);
    std::string (*log_before)(const std::string &base);
    std::string (*log_after)(const expectation &expected, bool succeeded);
};

extern const way ways[3];

} // namespace quillmere_test
