// Which bytes may stand in a reply, and how requests write texts and numbers.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace emulator {

/**
 * Whether the text is well-formed UTF-8 of characters that XML 1.0 can carry. Everything that the
 * service stores or echoes has passed this, so that a reply can always be written.
 */
bool is_xml_text(std::string_view text);

/** The text with each "%xx" decoded, or nothing if a "%" lacks its two hexadecimal digits. */
std::optional<std::string> percent_decoded(std::string_view encoded);

/** The value of a decimal number without sign or blanks, or nothing if it is none or too large. */
std::optional<std::uint64_t> parse_decimal(std::string_view text, std::uint64_t largest);

/** Without the blanks and tabs around it that may stand around what a header field says. */
std::string_view trimmed(std::string_view text);

} // namespace emulator
