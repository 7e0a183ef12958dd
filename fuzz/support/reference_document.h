// A reply as a list of what happens in it, and slow, straightforward readings of that list, for the
// library's to be compared with.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace quillmere_fuzz {

enum class happening { start, end, text };

struct event {
    happening what;
    std::string text; // an element's name, or a piece of text
};

struct document {
    std::vector<event> events; // up to where it is damaged
    bool well_formed;
};

// Reads what is not empty; nothing at all counts as well formed, as it does to the library.
document read_document(std::string_view xml);

// The text of what is sought, a name or a path.
std::optional<std::string> look_up(const document &in, const std::string &sought);

struct reference_error {
    int32_t number;
    std::optional<std::string> message;
};

reference_error read_error(const document &in);

// Larger documents are only read by the library, to see what that costs.
constexpr size_t most_bytes_to_compare = 8192;

// As the fields of a record or a result come out of the library.
inline std::optional<std::string> as_optional(const char *text)
{
    return text ? std::optional<std::string>(text) : std::nullopt;
}

} // namespace quillmere_fuzz
