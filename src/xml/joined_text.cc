#include "xml/joined_text.h"

#include <algorithm>
#include <cstring>

#include "runtime/memory.h"

namespace quillmere {

void joined_text::append(char **value, const char *piece, int length)
{
    if (!*value)
        length_ = capacity_ = 0;
    auto count = static_cast<uint64_t>(length);
    uint64_t needed = length_ + count + 1;
    if (needed > capacity_) {
        capacity_ = std::max(needed, 2 * capacity_);
        *value = static_cast<char *>(reallocate(*value, capacity_));
    }
    std::memcpy(*value + length_, piece, count);
    length_ += count;
    (*value)[length_] = '\0';
}

} // namespace quillmere

using namespace quillmere;

void node_value_data_accumulate(char **value, const char *text, int32_t length)
{
    uint64_t held = *value ? std::strlen(*value) : 0;
    auto count = static_cast<uint64_t>(length);
    *value = static_cast<char *>(reallocate(*value, held + count + 1));
    std::memcpy(*value + held, text, count);
    (*value)[held + count] = '\0';
}
