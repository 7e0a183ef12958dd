// What targets of the library share: its log led away, and its results in owners.
#pragma once

#include <cstdio>
#include <memory>
#include <string>

#include "quillmere.h"
#include "support/target.h"

namespace quillmere_fuzz {

// Leads the log to where it costs nothing and helps nobody.
inline void silence_log()
{
    static std::FILE *const nowhere = std::fopen("/dev/null", "w");
    set_output_file(nowhere);
}

struct free_text {
    void operator()(char *text) const { api_free(text); }
};

using owned_text = std::unique_ptr<char, free_text>;

struct delete_buffer {
    void operator()(string_buffer *buffer) const { string_delete(buffer, 1); }
};

// For extractors, whose records are much larger than the few bytes that an empty one takes in a
// reply.
constexpr budget listed = {0.2, 4e-6, 1 << 20, 128};

// Without the first node, which holds no record.
template <class List> int32_t length_of(const List *list)
{
    int32_t length = 0;
    for (const List *node = list->next; node; node = node->next)
        ++length;
    return length;
}

using owned_buffer = std::unique_ptr<string_buffer, delete_buffer>;

} // namespace quillmere_fuzz
