// Standard error: one line for a person at a time.
#pragma once

#include <string>

namespace quillmere::tools {

/** "quillmere: warning: ..." */
void warn(const std::string &message);

/** "quillmere: ...", for what a person who waits should know. */
void note(const std::string &message);

} // namespace quillmere::tools
