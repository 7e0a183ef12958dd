// The "Range" of a request, and the part of a file that it means.
#pragma once

#include <cstdint>
#include <string_view>

namespace emulator {

enum class range_kind { whole, part, unsatisfiable };

struct byte_range {
    range_kind kind;
    std::uint64_t first = 0;
    std::uint64_t length = 0;
};

/**
 * One range in bytes counts; anything else that may stand there, several ranges among it, is
 * ignored, as the protocol allows, and means the whole.
 */
byte_range range_of(std::string_view field, std::uint64_t size);

} // namespace emulator
