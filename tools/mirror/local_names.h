// Names of files in a mirror: those that the account's entries can have here, and those that make
// way for them.
#pragma once

#include <optional>
#include <string>

namespace quillmere::tools {

/** The folder that a mirror keeps its own things in, at the top of the copy. */
constexpr const char *mirror_folder_name = ".quillmere-mirror";

enum class name_place { at_top, below };

/** Why no file here can have the name, or nothing when one can. */
std::optional<std::string> complaint_about_local_name(const std::string &name, name_place where);

/** The name for what makes way: "a.txt.local-1", shortened where it would be too long. */
std::string name_beside(const std::string &name, unsigned number);

} // namespace quillmere::tools
