// Bytes to send around, and what they are compared by.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace quillmere_test {

/** SHA-256 in hexadecimal, of a text and of a file. */
std::string sha256_of(const std::string &bytes);
std::string sha256_of_file(const std::string &path);

/** Bytes that look like nothing, the same for each seed. */
std::string some_bytes(std::size_t count, std::uint32_t seed = 1);

} // namespace quillmere_test
