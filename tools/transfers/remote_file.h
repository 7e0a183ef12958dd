// What a transfer has to know of a file of the service.
#pragma once

#include <cstdint>
#include <map>
#include <string>

#include "../account.h"
#include "partial_file.h"

namespace quillmere::tools {

struct remote_file {
    std::string key;
    std::string name;
    std::string revision; ///< in decimal, as it was sent
    expected_content content;
    bool has_content = false; ///< its digest is known, or else it never got any
};

remote_file remote_file_of(const file_info *record);

/** A folder of the service and what it holds, listed when it is first asked for. */
class remote_folder {
public:
    remote_folder(const account &owner, remote_entry entry, std::string path)
        : owner_(owner), entry_(std::move(entry)), path_(std::move(path))
    {
    }

    const remote_entry &entry() const { return entry_; }
    /** For messages. */
    std::string path_of(const std::string &name) const { return path_below(path_, name); }

    /** The file of that name, or null. */
    const remote_file *file(const std::string &name);
    /** The folder inside, which is created if it is missing. */
    remote_folder enter(const std::string &name);

private:
    void list();

    const account &owner_;
    remote_entry entry_;
    std::string path_;
    bool listed_ = false;
    std::map<std::string, remote_file> files_;
    std::map<std::string, remote_entry> folders_;
};

} // namespace quillmere::tools
