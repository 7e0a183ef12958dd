#include "store/feed.h"

#include "store/accounts.h"
#include "store/database.h"

namespace emulator {
namespace {

// Each yields, for an entry ?2 and an account ?1: id, key, is_folder, parent_key and a rank that
// puts parents ahead of what they hold. An attached folder lies in the root of whom attached it.
constexpr const char *file_entry =
    "SELECT f.id AS id, f.key AS key, 0 AS is_folder, p.key AS parent_key, 0 AS rank"
    " FROM files f JOIN folders p ON p.id = f.folder WHERE f.id = ?2";

constexpr const char *folder_entry =
    "SELECT f.id AS id, f.key AS key, 1 AS is_folder,"
    " CASE WHEN EXISTS (SELECT 1 FROM attachments WHERE account = ?1 AND folder = f.id)"
    "  THEN (SELECT key FROM folders WHERE account = ?1 AND parent IS NULL)"
    "  ELSE p.key END AS parent_key, 0 AS rank"
    " FROM folders f JOIN folders p ON p.id = f.parent WHERE f.id = ?2";

constexpr const char *held_folders =
    "WITH RECURSIVE held (id, rank) AS (SELECT ?2, 1 UNION ALL"
    " SELECT f.id, rank + 1 FROM folders f JOIN held ON f.parent = held.id"
    " WHERE f.deleted IS NULL AND NOT EXISTS"
    " (SELECT 1 FROM attachments WHERE account = ?1 AND folder = f.id)) ";

std::string entries_of(feed_scope scope)
{
    if (scope == feed_scope::file)
        return file_entry;
    if (scope == feed_scope::folder)
        return folder_entry;
    return std::string(held_folders) + folder_entry +
           " UNION ALL SELECT f.id, f.key, 1, p.key, held.rank FROM held"
           " JOIN folders f ON f.id = held.id JOIN folders p ON p.id = f.parent WHERE held.id != ?2"
           " UNION ALL SELECT f.id, f.key, 0, p.key, held.rank + 1 FROM held"
           " JOIN folders p ON p.id = held.id JOIN files f ON f.folder = p.id"
           " WHERE f.deleted IS NULL";
}

std::int64_t revision_of(database &store, std::int64_t account)
{
    return static_cast<std::int64_t>(account_revision(store, account));
}

std::vector<std::int64_t> numbers(statement query)
{
    std::vector<std::int64_t> all;
    while (query.step())
        all.push_back(query.number(0));
    return all;
}

struct attachment {
    std::int64_t account;
    std::int64_t folder;
};

std::vector<attachment> attachments_inside(database &store, std::int64_t top)
{
    std::vector<attachment> found;
    statement query = store.prepare("WITH RECURSIVE held (id) AS (VALUES (?1) UNION ALL"
                                    " SELECT f.id FROM folders f JOIN held ON f.parent = held.id"
                                    " WHERE f.deleted IS NULL) SELECT a.account, a.folder"
                                    " FROM held JOIN attachments a ON a.folder = held.id"
                                    " WHERE held.id != ?1 ORDER BY a.account, a.folder");
    query.bind(top);
    while (query.step())
        found.push_back({query.number(0), query.number(1)});
    return found;
}

void add_to(feed_block &block, const statement &row)
{
    feed_entry entry{row.text(0), row.text(1), static_cast<std::uint64_t>(row.number(2)),
                     row.number(5), row.text(6)};
    const bool is_folder = row.number(3) != 0;
    const bool is_deleted = row.number(4) != 0;
    block.reached = entry.revision;
    if (is_deleted)
        (is_folder ? block.deleted_folders : block.deleted_files).push_back(std::move(entry));
    else
        (is_folder ? block.updated_folders : block.updated_files).push_back(std::move(entry));
}

} // namespace

void record_for(database &store, std::int64_t account, feed_scope scope, std::int64_t id,
                feed_kind kind)
{
    const std::int64_t before = revision_of(store, account);
    store
        .prepare("INSERT INTO feed (account, key, is_folder, parent_key, revision, deleted)"
                 " SELECT ?1, key, is_folder, parent_key,"
                 "  ?3 + row_number() OVER (ORDER BY rank, is_folder DESC, id), ?4"
                 " FROM (" +
                 entries_of(scope) +
                 ") WHERE true ON CONFLICT (account, key) DO UPDATE SET"
                 " parent_key = excluded.parent_key, revision = excluded.revision,"
                 " deleted = excluded.deleted")
        .bind(account, id, before, std::int64_t{kind == feed_kind::deleted})
        .run();
    const std::int64_t recorded = store.changed_rows();
    store.prepare("UPDATE accounts SET revision = revision + ? WHERE id = ?")
        .bind(recorded, account)
        .run();
}

std::vector<std::int64_t> viewers_of(database &store, std::int64_t folder)
{
    statement query =
        store.prepare("WITH RECURSIVE above (id) AS (VALUES (?1) UNION ALL"
                      " SELECT f.parent FROM folders f JOIN above ON f.id = above.id"
                      " WHERE f.parent IS NOT NULL)"
                      " SELECT account FROM folders WHERE id = ?1 UNION ALL"
                      " SELECT account FROM (SELECT DISTINCT a.account FROM attachments a"
                      "  JOIN above ON a.folder = above.id ORDER BY a.account)");
    query.bind(folder);
    return numbers(std::move(query));
}

std::vector<std::int64_t> attachers_of(database &store, std::int64_t folder)
{
    statement query =
        store.prepare("SELECT account FROM attachments WHERE folder = ? ORDER BY account");
    query.bind(folder);
    return numbers(std::move(query));
}

void record_folder(database &store, std::int64_t folder)
{
    for (const std::int64_t viewer : viewers_of(store, folder))
        record_for(store, viewer, feed_scope::folder, folder, feed_kind::updated);
}

void record_file(database &store, std::int64_t file, std::int64_t folder, feed_kind kind)
{
    for (const std::int64_t viewer : viewers_of(store, folder))
        record_for(store, viewer, feed_scope::file, file, kind);
}

void record_tree(database &store, std::int64_t folder, feed_kind kind)
{
    for (const std::int64_t viewer : viewers_of(store, folder))
        record_for(store, viewer, feed_scope::tree, folder, kind);
    // Whoever attached a part of it sees that part elsewhere, with or without the rest.
    for (const attachment &each : attachments_inside(store, folder))
        record_for(store, each.account, feed_scope::tree, each.folder, kind);
}

feed_view view_of(database &store, std::int64_t account, const std::string &key)
{
    statement query =
        store.prepare("SELECT parent_key, revision FROM feed WHERE account = ? AND key = ?");
    if (query.bind(account, std::string_view(key)).step())
        return {query.text(0), static_cast<std::uint64_t>(query.number(1))};
    return {{}, account_revision(store, account)};
}

feed_block read_feed(database &store, std::int64_t account, std::uint64_t after,
                     std::int64_t at_most)
{
    feed_block block;
    statement query = store.prepare(
        "SELECT feed.key, feed.parent_key, feed.revision, feed.is_folder, feed.deleted,"
        " files.created, files.name FROM feed LEFT JOIN files ON files.key = feed.key"
        " WHERE feed.account = ? AND feed.revision > ? ORDER BY feed.revision LIMIT ?");
    query.bind(account, static_cast<std::int64_t>(after), at_most + 1);
    for (std::int64_t taken = 0; query.step(); ++taken) {
        if (taken == at_most)
            return block; // there are more, so the client stands at the last one taken
        add_to(block, query);
    }
    block.reached = account_revision(store, account);
    return block;
}

} // namespace emulator
