// What is uploaded: ordinary files, and standard input.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "../descriptor.h"

namespace quillmere::tools {

/** A file to be read, with the size and the digest that it had when it was opened. */
struct local_source {
    std::string path; ///< for messages
    descriptor file;
    std::uint64_t size = 0;
    std::string digest; ///< SHA-256, 32 bytes
};

/** Opens a file and reads it once for its digest; a failure for what is no ordinary file. */
local_source open_source(const std::string &path);

/** The same of all that standard input gives, which is kept in a file without a name meanwhile. */
local_source take_standard_input();

bool is_local_folder(const std::string &path);
bool is_link(const std::string &path);

/** The name that a file or folder is uploaded under: the last one of its path. */
std::string name_of_source(const std::string &path);

/** The names in a folder, sorted. */
std::vector<std::string> names_in_folder(const std::string &path);

} // namespace quillmere::tools
