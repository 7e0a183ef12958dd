#include "byte_range.h"

#include <algorithm>
#include <limits>
#include <optional>

#include "text.h"

namespace emulator {
namespace {

constexpr std::uint64_t any = std::numeric_limits<std::uint64_t>::max();

bool is_bytes_unit(std::string_view unit)
{
    constexpr std::string_view bytes = "bytes";
    return unit.size() == bytes.size() &&
           std::equal(unit.begin(), unit.end(), bytes.begin(),
                      [](char one, char other) { return (one | 0x20) == other; });
}

byte_range whole(std::uint64_t size) { return {range_kind::whole, 0, size}; }

byte_range part(std::uint64_t first, std::uint64_t last, std::uint64_t size)
{
    if (first >= size)
        return {range_kind::unsatisfiable};
    return {range_kind::part, first, std::min(last, size - 1) - first + 1};
}

// "-500": the last so many bytes.
byte_range ending(std::string_view count_text, std::uint64_t size)
{
    const auto count = parse_decimal(count_text, any);
    if (!count)
        return whole(size);
    if (*count == 0 || size == 0)
        return {range_kind::unsatisfiable};
    return part(size - std::min(*count, size), size - 1, size);
}

} // namespace

byte_range range_of(std::string_view field, std::uint64_t size)
{
    const std::size_t equals = field.find('=');
    if (equals == std::string_view::npos || !is_bytes_unit(trimmed(field.substr(0, equals))))
        return whole(size);
    const std::string_view set = trimmed(field.substr(equals + 1));
    const std::size_t dash = set.find('-');
    if (dash == std::string_view::npos)
        return whole(size);
    if (dash == 0)
        return ending(set.substr(1), size);
    const auto first = parse_decimal(set.substr(0, dash), any);
    const std::string_view last_text = set.substr(dash + 1);
    const std::optional<std::uint64_t> last =
        last_text.empty() ? any : parse_decimal(last_text, any);
    if (!first || !last || *last < *first)
        return whole(size);
    return part(*first, *last, size);
}

} // namespace emulator
