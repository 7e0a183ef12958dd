// Paths such as /photos/2026. The service itself has keys alone, so a path is followed from one
// folder's listing to the next.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace quillmere::tools {

enum class entry_kind { folder, file };

/** "folder" or "file". */
const char *word_for(entry_kind kind);

/** A folder or a file of the service. */
struct remote_entry {
    entry_kind kind = entry_kind::folder;
    std::string key; ///< empty for the account's root
    std::string name;
    std::string parent_key; ///< of the folder it is in; empty for the root, and for the root's own

    bool is_folder() const { return kind == entry_kind::folder; }
    bool is_root() const { return key.empty(); }
    /** The key as the library takes it: NULL for the root. */
    const char *key_or_null() const { return is_root() ? nullptr : key.c_str(); }
};

/** What following a path asks of the service; a test gives its own. Both throw failure. */
struct remote_tree {
    /** Everything of a kind that a folder holds. */
    std::function<std::vector<remote_entry>(const remote_entry &folder, entry_kind kind)> list;
    /** The entry that has a key. */
    std::function<remote_entry(const std::string &key)> describe;
};

/** How far a path leads. */
struct remote_place {
    remote_entry reached;             ///< the last entry that exists on the way
    std::vector<std::string> missing; ///< the names behind it, none when the path leads to it
    bool folder_meant = false;        ///< the path ends in a slash

    bool exists() const { return missing.empty(); }
};

/**
 * Follows a path as far as it leads.
 *
 * @param path names with slashes between, from the account's root on, whether it begins with a
 *             slash or not; or key:KEY for what has this key, and key:KEY/a/b for what is below it
 *
 * Throws failure: for a path that cannot be one, a file where a folder must be, a name that several
 * entries of the folder have, and what the tree throws.
 */
remote_place follow_path(const remote_tree &tree, const std::string &path);

/** The entry that a path leads to; a failure when there is none. */
remote_entry find_entry(const remote_tree &tree, const std::string &path);

/** The same, and a failure when it is of the other kind. */
remote_entry find_folder(const remote_tree &tree, const std::string &path);
remote_entry find_file(const remote_tree &tree, const std::string &path);

/** The failure of a path that leads nowhere. */
[[noreturn]] void throw_missing(const std::string &path);

/** Whether a text can be a key: the library sends keys as they are, so that another character could
 * add a parameter of its own. */
bool is_key(std::string_view text);

/** The key in a path that is "key:" and a key, and nothing else. */
std::optional<std::string> key_in(const std::string &path);

/** The path of what a folder holds under a name. */
std::string path_below(const std::string &folder_path, const std::string &name);

} // namespace quillmere::tools
