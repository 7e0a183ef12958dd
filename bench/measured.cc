#include "measured.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <vector>

namespace quillmere_bench {
namespace {

double seconds_of(const std::function<void()> &work, unsigned calls)
{
    double start = cpu_seconds();
    for (unsigned call = 0; call < calls; ++call)
        work();
    return (cpu_seconds() - start) / calls;
}

double median(std::vector<double> values)
{
    auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

// In microseconds a call, where that has a sense.
void print_row(const pairing &pair, double own, double reference, double median_ratio)
{
    std::printf("| %s | %.2f | %.2f | %.3f | %.3f | ", pair.what.c_str(), own * 1e6,
                reference * 1e6, own / reference, median_ratio);
    if (pair.at_most > no_figure)
        std::printf("%.2f |\n", pair.at_most);
    else
        std::printf("- |\n");
    std::fflush(stdout);
}

} // namespace

double cpu_seconds()
{
    timespec now = {};
    ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

void print_heading()
{
    std::printf("| what | own, us | reference, us | ratio of the best | median ratio | asked |\n"
                "| --- | --: | --: | --: | --: | --: |\n");
}

void measure(const pairing &pair, unsigned rounds)
{
    std::vector<double> own;
    std::vector<double> reference;
    std::vector<double> ratios;
    pair.own(); // what is made once is made before
    pair.reference();
    for (unsigned round = 0; round < rounds; ++round) {
        pair.prepare();
        bool own_first = round % 2 == 0;
        if (own_first)
            own.push_back(seconds_of(pair.own, pair.calls));
        reference.push_back(seconds_of(pair.reference, pair.calls));
        if (!own_first)
            own.push_back(seconds_of(pair.own, pair.calls));
        ratios.push_back(own.back() / reference.back());
    }
    print_row(pair, *std::min_element(own.begin(), own.end()),
              *std::min_element(reference.begin(), reference.end()), median(ratios));
}

} // namespace quillmere_bench
