// How the copy is to look: every known entry at its place, but for those that no file here can be.
#pragma once

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "known_account.h"

namespace quillmere::tools {

struct wanted_entry {
    entry_kind kind = entry_kind::folder;
    std::string parent; ///< key; the mirrored folder's for what is at the top
    std::string name;
    expected_content content; ///< of a file

    bool is_folder() const { return kind == entry_kind::folder; }
};

/** An entry without a place, with all that it holds. */
struct left_out_entry {
    std::string key;
    std::string path;
    std::string why;
};

struct layout {
    std::string root;
    std::vector<std::string> order; ///< the keys, folders ahead of what they hold
    std::map<std::string, wanted_entry> entries;
    std::map<std::pair<std::string, std::string>, std::string> keys; ///< by parent and name
    std::vector<left_out_entry> left_out;

    const wanted_entry *find(const std::string &key) const;
    /** Who is to have a name in a folder, or null. */
    const std::string *key_at(const std::string &parent, const std::string &name) const;
    /** "photos/a.jpg", from the mirrored folder on. */
    std::string path_of(const std::string &key) const;
};

/**
 * Lays the account out. Of several entries that have one name in a folder, a folder goes ahead of a
 * file and the smaller key ahead of the larger, so that every mirror shows the same one. An entry
 * that was never described has no place yet.
 */
layout lay_out(const known_account &account);

} // namespace quillmere::tools
