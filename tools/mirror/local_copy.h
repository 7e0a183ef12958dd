// The copy on the disk. Names that the service gave are used inside an open folder alone, and a
// link in the place of a folder is never followed, so that nothing is ever done outside.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "../transfers/local_folder.h"
#include "placement.h"

namespace quillmere::tools {

class local_copy {
public:
    /** Opens the folder of a copy, which is made if it is missing, and the mirror's own in it. A
     * failure when another process mirrors into it. */
    explicit local_copy(const std::string &path);

    /** The same, but only to look at: what is missing stays so, and nothing is to be changed. */
    static local_copy to_look_at(const std::string &path);
    bool may_be_changed() const { return may_be_changed_; }

    bool exists() const { return top_.has_value(); }
    /** Of a copy that exists. */
    const local_folder &top() const { return *top_; }
    /** Whether a mirror has been at work in it. */
    bool is_begun() const { return own_.has_value(); }
    /** The mirror's own, of a copy that is begun: the state, what is set aside, and downloads on
     * their way. */
    const local_folder &own() const { return *own_; }

    /** The name under which an entry is set aside. */
    static std::string aside_name(const std::string &key) { return "entry-" + key; }

    /** Removes what is left of downloads. */
    void clear_downloads() const;

private:
    local_copy() = default;
    void lock(int kind) const;

    std::optional<local_folder> top_;
    std::optional<local_folder> own_;
    bool may_be_changed_ = false;
};

/** Opens the folders of a copy by their keys, from where they are. */
class copy_folders {
public:
    /** All outlive it. */
    copy_folders(const local_copy &copy, const std::string &root, const placements &here)
        : copy_(copy), root_(root), here_(here)
    {
    }

    /** Nothing when the folder is not where it should be. */
    std::optional<local_folder> find(const std::string &key) const;
    /** The same, but a failure then. */
    local_folder open(const std::string &key) const;

private:
    const local_copy &copy_;
    const std::string &root_;
    const placements &here_;
};

/** Where an entry is, from the mirrored folder on. */
std::string path_of(const placement &placed, const placements &here);

/** What a folder holds, "." and ".." too. */
std::vector<std::string> names_in(const local_folder &folder);

/** The stamp of what has a name: of a regular file, or of a folder. */
std::optional<file_stamp> stamp_of_file(const local_folder &folder, const std::string &name);
std::optional<file_stamp> stamp_of_folder(const local_folder &folder, const std::string &name);

/** Gives a thing another place, whose name must be free: false when it is not. */
bool move_to_free_name(const local_folder &from, const std::string &name, const local_folder &to,
                       const std::string &new_name);

/** The same, in place of the file that has the name. */
void move_over(const local_folder &from, const std::string &name, const local_folder &to,
               const std::string &new_name);

} // namespace quillmere::tools
