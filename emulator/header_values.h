// What the header of an upload says of its bytes. Both throw a refusal for a field that is
// malformed.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace emulator {

/** The file name of a Content-Disposition (RFC 6266), or nothing if it has none. */
std::optional<std::string> file_name_in(std::string_view disposition);

/**
 * The SHA-256 of a Content-Digest or Repr-Digest (RFC 9530) in lower-case hexadecimal digits, or
 * nothing if it has none: digests of other kinds are not read.
 */
std::optional<std::string> sha256_in(const char *field, std::string_view value);

} // namespace emulator
