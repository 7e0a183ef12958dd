// Text that comes from outside, made fit for one line, for a terminal, or for JSON.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <nlohmann/json_fwd.hpp>

namespace quillmere::tools {

/**
 * The text with everything written out that could move a cursor, change a colour or reverse the
 * direction of writing: "\n" and "\t" as such, other control and direction characters as "\u{9b}",
 * bytes that are no UTF-8 as "\xff". The backslash itself stays as it is.
 */
std::string escape_controls(std::string_view text);

/** How many columns the text takes, one for each code point. */
std::size_t columns(std::string_view text);

/** The document and a line end. Bytes that are no UTF-8 become U+FFFD; the output is ASCII, so that
 * a terminal finds no control characters in it. */
std::string json_line(const nlohmann::ordered_json &document);

/** The number that a text is in decimal digits, without any that it could do without. */
std::optional<std::uint64_t> decimal_number(std::string_view text);

/** What the service sent as a text: a number if it is one in decimal, null if it is NULL. */
nlohmann::ordered_json number_or_text(const char *text);

/** What the service sent as a text: null if it is NULL. */
nlohmann::ordered_json text_or_null(const char *text);

/** A text of ours that may be missing: null if it is empty. */
nlohmann::ordered_json text_unless_empty(const std::string &text);

/** A text for which NULL is as good as none. */
std::string text_or_empty(const char *text);

/** ASCII only, whatever the locale. */
std::string lower_case(std::string_view text);
std::string_view trimmed(std::string_view text);
bool starts_with(std::string_view text, std::string_view beginning);
bool ends_with(std::string_view text, std::string_view ending);

} // namespace quillmere::tools
