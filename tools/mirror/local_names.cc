#include "local_names.h"

#include <algorithm>
#include <climits>

namespace quillmere::tools {

namespace {

bool is_inside_character(char byte) { return (static_cast<unsigned char>(byte) & 0xc0) == 0x80; }

} // namespace

std::optional<std::string> complaint_about_local_name(const std::string &name, name_place where)
{
    if (name.empty())
        return "it has no name";
    if (name == "." || name == "..")
        return "its name is that of a folder itself or of the one above";
    if (name.find('/') != std::string::npos || name.find('\0') != std::string::npos)
        return "its name cannot be that of a file";
    if (name.size() > NAME_MAX)
        return "its name is too long";
    if (where == name_place::at_top && name == mirror_folder_name)
        return "its name is that of the mirror's own folder";
    return std::nullopt;
}

std::string name_beside(const std::string &name, unsigned number)
{
    const std::string ending = ".local-" + std::to_string(number);
    std::size_t kept = std::min<std::size_t>(name.size(), NAME_MAX - ending.size());
    while (kept > 0 && kept < name.size() && is_inside_character(name[kept]))
        --kept;
    return name.substr(0, kept) + ending;
}

} // namespace quillmere::tools
