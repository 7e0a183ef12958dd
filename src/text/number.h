// Numbers read from replies. The service's figures are taken as they come: text without digits
// counts as 0, and what follows the digits is ignored.
#pragma once

#include <cstdlib>

#include "quillmere.h"

namespace quillmere {

// As atoi() does it here, without its undefined results for large numbers.
inline int32_t int32_in(const char *text)
{
    return static_cast<int32_t>(std::strtol(text, nullptr, 10));
}

inline uint64_t uint64_in(const char *text) { return std::strtoul(text, nullptr, 10); }

// A refusal's number; one that is 0 or no number at all must not look like success.
inline int32_t error_number_in(const char *text)
{
    int32_t number = int32_in(text);
    return number == 0 ? QM_UNUSABLE_ERROR_NUMBER : number;
}

} // namespace quillmere
