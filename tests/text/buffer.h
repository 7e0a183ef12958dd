// What the tests of the string buffer have in common.
#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "quillmere.h"

namespace quillmere_test {

struct buffer_deleter {
    void operator()(string_buffer *buffer) const { string_delete(buffer, 1); }
};
using owned_buffer = std::unique_ptr<string_buffer, buffer_deleter>;

inline owned_buffer new_buffer(uint64_t capacity = 0) { return owned_buffer(string_new(capacity)); }

inline owned_buffer buffer_of(const std::string &text)
{
    owned_buffer buffer = new_buffer();
    string_append_len(buffer.get(), text.data(), text.size());
    return buffer;
}

// The text with every NUL in it.
inline std::string text_of(const owned_buffer &buffer)
{
    const char *bytes = string_get(buffer.get());
    return bytes ? std::string(bytes, string_get_size(buffer.get())) : std::string();
}

using range = std::pair<uint64_t, uint64_t>;

// The ranges in the order of the list.
inline std::vector<range> ranges_of(const owned_buffer &buffer)
{
    std::vector<range> ranges;
    for (const redaction_range *each = buffer->redaction_ranges; each; each = each->next)
        ranges.emplace_back(each->start, each->end);
    return ranges;
}

} // namespace quillmere_test
