// Leads the library's diagnostic log nowhere for as long as the object lives, for tests that make
// more of it than memory should hold.
#pragma once

#include <cstdio>

#include "quillmere.h"
#include "support/failure.h"

namespace quillmere_test {

class unread_log {
public:
    unread_log() : before_(output_file), stream_(std::fopen("/dev/null", "w"))
    {
        require(stream_ != nullptr, "open /dev/null");
        set_output_file(stream_);
    }
    ~unread_log()
    {
        set_output_file(before_);
        std::fclose(stream_);
    }
    unread_log(const unread_log &) = delete;
    unread_log &operator=(const unread_log &) = delete;

private:
    std::FILE *before_;
    std::FILE *stream_;
};

} // namespace quillmere_test
