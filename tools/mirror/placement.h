// What a mirror has put into the copy, and how it would know it again.
#pragma once

#include <cstdint>
#include <map>
#include <string>

#include "../remote_path.h"
#include "../transfers/partial_file.h"

namespace quillmere::tools {

/** By this a file is the one that was written, without its bytes being read. */
struct file_stamp {
    std::uint64_t inode = 0;
    std::uint64_t size = 0;
    std::int64_t modified = 0; ///< in nanoseconds since 1970

    bool operator==(const file_stamp &other) const
    {
        return inode == other.inode && size == other.size && modified == other.modified;
    }
};

struct placement {
    entry_kind kind = entry_kind::folder;
    std::string parent; ///< key of the folder that it was put into
    std::string name;
    expected_content content;  ///< of a file
    file_stamp stamp;          ///< of a folder the inode alone
    bool set_aside = false;    ///< it is in the mirror's own folder, on its way
    bool changed_here = false; ///< found out when looked at, never kept

    bool is_folder() const { return kind == entry_kind::folder; }
    bool is_at(const std::string &folder, const std::string &called) const
    {
        return !set_aside && parent == folder && name == called;
    }
};

using placements = std::map<std::string, placement>; // by key

} // namespace quillmere::tools
