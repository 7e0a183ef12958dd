// Counts for the documents that tests cut off.
#pragma once

#include <cstdint>
#include <string>

namespace quillmere_test {

inline int32_t occurrences(const std::string &sought, const std::string &text)
{
    int32_t count = 0;
    for (size_t at = text.find(sought); at != std::string::npos; at = text.find(sought, at + 1))
        ++count;
    return count;
}

} // namespace quillmere_test
