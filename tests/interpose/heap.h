// A heap that runs out when a test says so, and that counts what is taken from it. Only the calls
// of the objects in the program itself come past here, which are the library's and the test's own.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillmere_test {

// While it lives, this thread gets the allowed number of allocations, then so many refusals.
class starved_heap {
public:
    explicit starved_heap(size_t allowed, size_t refusals = SIZE_MAX);
    ~starved_heap();
    starved_heap(const starved_heap &) = delete;
    starved_heap &operator=(const starved_heap &) = delete;

    // How many allocations were refused so far.
    size_t refused() const;
};

// Blocks that this thread has taken and not given back.
int64_t blocks_held();

} // namespace quillmere_test
