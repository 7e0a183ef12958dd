// Where the body of a response goes, and how much of it is taken.
#pragma once

#include <cstdint>

#include "owned.h"

namespace quillmere {

// What one transfer receives. It must outlive the transfer.
class response_body {
public:
    explicit response_body(string_buffer *received) : received_(received) {}

    // Without a limit the handle is given the exported function, as an application would.
    void receive_with(CURL *handle);

    // Takes the bytes or, past the limit, nothing more at all.
    size_t take(const char *bytes, size_t count);

private:
    string_buffer *received_;
    uint64_t limit_ = 0;
};

} // namespace quillmere
