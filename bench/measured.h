// Pairs of measurements: a thing and what it is compared with, by turns, so that whatever else the
// machine does meets both.
#pragma once

#include <functional>
#include <string>

namespace quillmere_bench {

// Processor time of the whole process, all its threads included.
double cpu_seconds();

constexpr double no_figure = 0; // asked of a row that explains others

struct pairing {
    std::string what;
    double at_most; // the ratio that is asked for
    std::function<void()> own;
    std::function<void()> reference;
    unsigned calls = 1;                    // of each in a round
    std::function<void()> prepare = [] {}; // before each round, not measured
};

void print_heading();

// Measures in so many rounds and prints a row of the table. Many short ones find a quiet moment of
// a machine that does other things, too.
void measure(const pairing &pair, unsigned rounds = 45);

} // namespace quillmere_bench
