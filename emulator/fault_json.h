// Faults as they are asked for and listed, in JSON.
#pragma once

#include <stdexcept>
#include <string>

#include <nlohmann/json_fwd.hpp>

#include "faults.h"

namespace emulator {

/** Why a text describes no fault, in words for whoever wrote it. */
class fault_refusal : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/**
 * Reads a fault. Throws a fault_refusal that says what is wrong and what would be right.
 *
 * @param any_seed for a fault that names no seed
 */
fault read_fault(const std::string &text, std::uint64_t any_seed);

/** Everything that was asked for, and the counts. */
nlohmann::ordered_json tell_fault(const placed_fault &placed);

} // namespace emulator
