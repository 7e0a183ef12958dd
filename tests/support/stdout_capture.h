// Catches what is written to standard output, through stdio, iostreams or the descriptor itself.
#pragma once

#include <string>

#include "support/descriptor.h"

namespace quillmere_test {

class stdout_capture {
public:
    stdout_capture();
    ~stdout_capture();
    stdout_capture(const stdout_capture &) = delete;
    stdout_capture &operator=(const stdout_capture &) = delete;

    // All that was written so far. Reading takes nothing away.
    std::string text() const;

private:
    descriptor before_;
    descriptor file_;
};

} // namespace quillmere_test
