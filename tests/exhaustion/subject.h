// What is called while memory runs out, and what became of it.
#pragma once

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

#include "api/account_calls.h"

namespace quillmere_test {

// So many allocations are made, then so many are refused.
struct shortage {
    size_t allowed;
    size_t refusals;
};

// How many allocations a shortage refuses: a momentary one and a lasting one.
constexpr size_t refusals_of_shortages[] = {1, SIZE_MAX};

using starved_call = std::function<call_outcome()>;

struct subject {
    std::string name;
    // Makes what the call needs while memory still suffices.
    std::function<starved_call()> prepare;
    // Of an operation: what its reply holds beside the result.
    std::string payload = "";
};

inline std::ostream &operator<<(std::ostream &stream, const subject &each)
{
    return stream << each.name;
}

inline std::string subject_name(const testing::TestParamInfo<subject> &tested)
{
    return tested.param.name;
}

// Every operation that asks the service.
const std::vector<subject> &operation_subjects();

// The calls that read a text they are given: extractors, look-ups, the upload's reply.
const std::vector<subject> &reading_subjects();

// The exchange, the probes and the upload connection, on a server at this base address.
std::vector<subject> transfer_subjects(const std::string &base_url);

} // namespace quillmere_test
