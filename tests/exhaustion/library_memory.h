// The memory of the libraries that ours uses, given out through the hooks that each offers for it.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillmere_test {

enum class memory_of { libcurl, expat, openssl };

// While it lives, a library gets the allowed number of allocations on this thread, then so many
// refusals. expat is reached at any time, OpenSSL if hook_openssl() came before everything else,
// libcurl while there is a hooked_libcurl.
class starved_library {
public:
    starved_library(memory_of library, size_t allowed, size_t refusals);
    ~starved_library();
    starved_library(const starved_library &) = delete;
    starved_library &operator=(const starved_library &) = delete;

    // How many allocations were refused so far.
    size_t refused() const;

private:
    memory_of library_;
};

// Blocks that a library has taken on this thread and not given back.
int64_t blocks_held_by(memory_of library);

// Must come before OpenSSL's first allocation in the process.
bool hook_openssl();

// To be made before the library is started and to outlive it: libcurl listens to its first start.
class hooked_libcurl {
public:
    hooked_libcurl();
    ~hooked_libcurl();
    hooked_libcurl(const hooked_libcurl &) = delete;
    hooked_libcurl &operator=(const hooked_libcurl &) = delete;
};

} // namespace quillmere_test
