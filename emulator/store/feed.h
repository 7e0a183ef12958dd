// The change feed: what each account sees of the trees, and when it last changed there.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace emulator {

class database;

enum class feed_kind { updated, deleted };

/** What a record is about: one entry, or a folder with all that it holds. */
enum class feed_scope { file, folder, tree };

/**
 * Gives the entry (each entry of a tree, parents first) the next revision of the account. The
 * newest record of an entry replaces its older ones. A tree ends at folders that the account has
 * attached by themselves: those are seen elsewhere.
 */
void record_for(database &store, std::int64_t account, feed_scope scope, std::int64_t id,
                feed_kind kind);

/** The accounts that see a folder: its owner first, then those that attached it or one above. */
std::vector<std::int64_t> viewers_of(database &store, std::int64_t folder);
/** The accounts that attached this very folder. */
std::vector<std::int64_t> attachers_of(database &store, std::int64_t folder);

/** The same record for every account that sees the entry, or a part of the tree. */
void record_folder(database &store, std::int64_t folder);
void record_file(database &store, std::int64_t file, std::int64_t folder, feed_kind kind);
void record_tree(database &store, std::int64_t folder, feed_kind kind);

/** How an account sees an entry. */
struct feed_view {
    std::string parent_key; // empty for a root
    std::uint64_t revision;
};

/** The view of the account on the entry; of a root, the revision of its whole tree. */
feed_view view_of(database &store, std::int64_t account, const std::string &key);

struct feed_entry {
    std::string key;
    std::string parent_key;
    std::uint64_t revision = 0;
    std::int64_t created = 0; // of files, as is the name
    std::string name;
};

struct feed_block {
    std::vector<feed_entry> updated_folders;
    std::vector<feed_entry> updated_files;
    std::vector<feed_entry> deleted_files;
    std::vector<feed_entry> deleted_folders;
    /** Where a client stands that knows this block and all before it. */
    std::uint64_t reached = 0;
};

/**
 * The records after a revision, oldest first, at most this many. When there are more, "reached" is
 * the revision of the last one handed out, or else that of the account.
 */
feed_block read_feed(database &store, std::int64_t account, std::uint64_t after,
                     std::int64_t at_most);

} // namespace emulator
