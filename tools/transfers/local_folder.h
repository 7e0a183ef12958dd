// Where downloads go. Names that the service gave are used inside an open folder alone, so that
// none of them leads out of it.
#pragma once

#include <optional>
#include <string>

#include "../descriptor.h"
#include "partial_file.h"

namespace quillmere::tools {

/** What stands under a name. */
enum class local_entry { nothing, file, folder, other };

class local_folder {
public:
    /** Opens a folder that the user named; its path may lead through symbolic links. */
    explicit local_folder(const std::string &path);

    /** The same folder once more. */
    local_folder again() const;

    /** Opens a folder inside, which is made if it is missing. A link in its place is refused. */
    local_folder enter(const std::string &name) const;
    /** Opens a folder inside that is there; nothing when there is none, or a link in its place. */
    std::optional<local_folder> find(const std::string &name) const;

    local_entry entry(const std::string &name) const;
    /** Whether the file of this name has these bytes. */
    bool has(const std::string &name, const expected_content &content) const;

    int number() const { return opened_.number(); }
    const std::string &path() const { return path_; }
    std::string path_of(const std::string &name) const;

private:
    local_folder(std::string path, descriptor opened)
        : path_(std::move(path)), opened_(std::move(opened))
    {
    }

    std::string path_;
    descriptor opened_;
};

/** Throws failure for a name from the service that cannot be one of a file inside a folder. */
void check_local_name(const std::string &name);

} // namespace quillmere::tools
