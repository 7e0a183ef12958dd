// Pairs of measurements: a thing and what it is compared with, by turns, so that whatever else the
// machine does meets both.
#pragma once

#include <functional>
#include <string>

namespace quillmere_bench {

// Processor time of the whole process, all its threads included.
double cpu_seconds();

struct pairing {
    std::string what;
    double at_most; // the ratio that is asked for
    std::function<void()> own;
    std::function<void()> reference;
    unsigned calls = 1; // of each in a round
};

void print_heading();

// Measures in so many rounds and prints a row of the table.
void measure(const pairing &pair, unsigned rounds = 15);

// A row whose ratios were measured elsewhere. Per call, in microseconds, where it has a sense.
void print_row(const std::string &what, double at_most, double own, double reference,
               double median_ratio);

} // namespace quillmere_bench
