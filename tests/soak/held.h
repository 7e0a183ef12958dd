// What a process holds at one moment, and whether it has grown by the next.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace quillmere_test {

struct held {
    size_t resident; // bytes that the process has in memory
    size_t in_use;   // bytes that it has taken from the heap and not given back
    size_t descriptors;
    size_t threads;
};

held held_now();

// Empty if nothing grew from the first of these moments on, or else what did. Resident memory goes
// up and down a little as the heap's free space is spread anew, so what has grown is what never
// comes down again: the least of the last five counts.
std::string growth_in(const std::vector<held> &moments);

} // namespace quillmere_test
