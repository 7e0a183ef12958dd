// Folders, and what is done with them one by one. Names and depths are judged here, access is not:
// whoever calls has made sure that the account may do it. Changes belong inside a transaction.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace emulator {

class database;

struct folder {
    std::int64_t id = 0;
    std::string key;
    std::int64_t account = 0; // its owner
    std::int64_t parent = 0;  // 0 for a root
    std::string name;
    std::string description;
    std::string tags;
    std::string privacy;
    std::int64_t created = 0;
    std::int64_t modified = 0;
    std::int64_t deleted = 0; // when; 0 while it lives

    bool is_root() const { return parent == 0; }
};

/** What an update changes; nothing of what is not set. */
struct metadata_change {
    std::optional<std::string> name;
    std::optional<std::string> description;
    std::optional<std::string> tags;
    std::optional<std::string> privacy;
    std::optional<std::int64_t> modified;

    bool is_empty() const { return !name && !description && !tags && !privacy && !modified; }
};

/** Makes an account's root; an account has one from its first moment on. */
void make_root(database &store, std::int64_t account, std::int64_t now);
folder root_of(database &store, std::int64_t account);
/** Deleted ones are found too. */
std::optional<folder> find_folder(database &store, std::string_view key);
folder folder_of_id(database &store, std::int64_t id);
/** The living folder of this name. */
std::optional<folder> find_folder_in(database &store, std::int64_t parent, std::string_view name);
/** The living folders inside, in the order in which they were made. */
std::vector<folder> folders_in(database &store, std::int64_t parent);

/** Writes the row alone, under the key that it has: the feed is not told. Returns its id. */
std::int64_t insert_folder(database &store, const folder &made);

struct new_folder {
    std::string name;
    std::int64_t now;
    std::int64_t modified;
};

/** Throws a refusal when the name is taken or the tree would grow too deep. Privacy comes from the
 * parent. */
folder create_folder(database &store, const folder &parent, const new_folder &made);

/** @param recursive whether a new privacy reaches all that the folder holds */
void update_folder(database &store, const folder &target, const metadata_change &change,
                   bool recursive);

} // namespace emulator
