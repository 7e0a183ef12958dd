// Joins the pieces in which expat delivers a text. It remembers where the text ends and how much
// room there is, so that a text of many pieces costs no more a byte than one of a single piece.
#pragma once

#include "quillmere.h"

namespace quillmere {

class joined_text {
public:
    // Appends to the value. A NULL one starts a new text; any other must be what the last append
    // left, touched by nobody else. It is malloc memory, NUL-terminated after every append.
    void append(char **value, const char *piece, int length);

private:
    uint64_t length_ = 0;
    uint64_t capacity_ = 0;
};

} // namespace quillmere
