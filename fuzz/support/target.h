// What a fuzz target is: a function that tries one input and stops the program when something that
// must hold does not. The same functions serve the fuzzer and the replay of the corpora.
#pragma once

#include <cstddef>
#include <functional>
#include <string_view>
#include <vector>

namespace quillmere_fuzz {

struct target {
    const char *name; // also that of its folder of inputs
    void (*try_input)(std::string_view input);
};

// A target of this program, made known where it is defined.
struct known_target {
    known_target(const char *name, void (*try_input)(std::string_view input));
};

const std::vector<target> &known_targets();

// Stops the program, telling what does not hold.
void expect(bool holds, const char *what);

// What a call on foreign bytes may cost: a share of its own, and one for each byte that it is
// given.
struct budget {
    double seconds;
    double seconds_per_byte;
    size_t memory; // at its peak, in bytes
    size_t memory_per_byte;
};

// Far above what is measured, and far below what a cost that grows with the square would come to.
constexpr budget linear = {0.2, 4e-6, 1 << 20, 64};

// Makes the call, and stops the program when it was not worth its price: in time of the processor,
// and, where a sanitizer counts it, in memory.
void within_budget(const budget &allowed, size_t bytes, const std::function<void()> &call);

} // namespace quillmere_fuzz
