// Finding a running emulator through the file that it writes when it is ready.
#pragma once

#include <string>

namespace quillmere::tools {

struct emulator_address {
    std::string secure_base;
    std::string plain_base;
    std::string ca_file;
};

/** The application that an emulator knows without being told, for development. */
constexpr const char *development_application_id = "42";
constexpr const char *development_application_key = "quillmere-development-key";

/** Reads a ready file's text; path names it in a failure. */
emulator_address read_ready_text(const std::string &text, const std::string &path);

/** Reads a ready file. */
emulator_address read_ready_file(const std::string &path);

} // namespace quillmere::tools
