// How many requests came, so that a test can tell what its client did.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>

namespace emulator {

class request_counts {
public:
    void count(std::string_view path);

    std::uint64_t total() const { return total_; }
    /** By endpoint; links by the folder of their kind, and what is neither as "other". */
    const std::map<std::string, std::uint64_t> &by_endpoint() const { return counts_; }

private:
    std::uint64_t total_ = 0;
    std::map<std::string, std::uint64_t> counts_;
};

} // namespace emulator
