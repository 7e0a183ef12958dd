// The time of day that the library reads, as a test wants it.
#pragma once

#include <ctime>

namespace quillmere_test {

// While it lives, it is this moment, by seconds since 1970. One at a time.
class pretended_time {
public:
    explicit pretended_time(std::time_t now);
    ~pretended_time();
    pretended_time(const pretended_time &) = delete;
    pretended_time &operator=(const pretended_time &) = delete;
};

} // namespace quillmere_test
