#include "store/trees.h"

#include <algorithm>
#include <vector>

#include "errors.h"
#include "store/attachments.h"
#include "store/database.h"
#include "store/entry_keys.h"
#include "store/feed.h"
#include "store/file_entries.h"
#include "store/names.h"
#include "store/usage.h"
#include "system_limits.h"

namespace emulator {
namespace {

// The folder ?1 and the living folders in it, each with its level.
const std::string held_by = "WITH RECURSIVE held (id, level) AS (SELECT ?1, 1 UNION ALL"
                            " SELECT f.id, level + 1 FROM folders f JOIN held"
                            " ON f.parent = held.id WHERE f.deleted IS NULL) ";
const std::string above =
    "WITH RECURSIVE above (id) AS (VALUES (?1) UNION ALL SELECT f.parent FROM folders f"
    " JOIN above ON f.id = above.id WHERE f.parent IS NOT NULL) ";

std::int64_t number_of(statement query)
{
    query.step();
    return query.number(0);
}

std::int64_t depth_of(database &store, std::int64_t folder)
{
    statement query = store.prepare(above + "SELECT count(*) - 1 FROM above");
    query.bind(folder);
    return number_of(std::move(query));
}

std::int64_t levels_of(database &store, std::int64_t folder)
{
    statement query = store.prepare(held_by + "SELECT max(level) FROM held");
    query.bind(folder);
    return number_of(std::move(query));
}

void check_destination(database &store, const folder &source, const folder &destination)
{
    if (lies_within(store, destination.id, source.id))
        throw refusal(error::into_itself);
    check_depth(store, destination.id, levels_of(store, source.id));
}

void mark_deleted(database &store, std::int64_t top, std::int64_t now)
{
    store.prepare(held_by + "DELETE FROM attachments WHERE folder IN (SELECT id FROM held)")
        .bind(top)
        .run();
    store
        .prepare(held_by + "UPDATE files SET deleted = ?2 WHERE deleted IS NULL"
                           " AND folder IN (SELECT id FROM held)")
        .bind(top, now)
        .run();
    store
        .prepare(held_by + "UPDATE folders SET deleted = ?2 WHERE deleted IS NULL"
                           " AND id IN (SELECT id FROM held)")
        .bind(top, now)
        .run();
}

// The rows alone; the feed is told once, when the whole tree stands.
folder copy_rows(database &store, const folder &source, const folder &into, const std::string &name,
                 std::int64_t now)
{
    folder made = source;
    made.key = new_folder_key();
    made.account = into.account;
    made.parent = into.id;
    made.name = name;
    made.created = now;
    made.id = insert_folder(store, made);
    for (const file &each : files_in(store, source.id))
        copy_file_row(store, each, made, each.name, now);
    for (const folder &each : folders_in(store, source.id))
        copy_rows(store, each, made, each.name, now);
    return made;
}

} // namespace

void check_depth(database &store, std::int64_t folder, std::int64_t levels)
{
    const auto deepest = static_cast<std::int64_t>(system_limits::folder_depth_limit);
    if (depth_of(store, folder) + levels > deepest)
        throw refusal(error::too_deep);
}

bool lies_within(database &store, std::int64_t folder, std::int64_t other)
{
    return store.prepare(above + "SELECT 1 FROM above WHERE id = ?2").bind(folder, other).step();
}

tree_totals totals_of(database &store, std::int64_t folder)
{
    statement query = store.prepare(
        held_by + "SELECT (SELECT count(*) - 1 FROM held), count(*), coalesce(sum(size), 0)"
                  " FROM files WHERE deleted IS NULL AND folder IN (SELECT id FROM held)");
    query.bind(folder).step();
    return {static_cast<std::uint64_t>(query.number(1)),
            static_cast<std::uint64_t>(query.number(0)),
            static_cast<std::uint64_t>(query.number(2))};
}

void delete_folder(database &store, const folder &target, std::int64_t now)
{
    record_tree(store, target.id, feed_kind::deleted);
    mark_deleted(store, target.id, now);
}

void move_folder(database &store, const folder &source, const folder &destination)
{
    check_destination(store, source, destination);
    check_name_is_free(store, destination.id, source.name, source.key);
    view_change seen(viewers_of(store, source.id), viewers_of(store, destination.id));
    seen.keep(attachers_of(store, source.id)); // it lies in their roots, wherever it goes
    for (const std::int64_t account : seen.lost())
        record_for(store, account, feed_scope::tree, source.id, feed_kind::deleted);
    store.prepare("UPDATE folders SET parent = ? WHERE id = ?")
        .bind(destination.id, source.id)
        .run();
    for (const std::int64_t account : seen.kept())
        record_for(store, account, feed_scope::folder, source.id, feed_kind::updated);
    for (const std::int64_t account : seen.gained())
        record_for(store, account, feed_scope::tree, source.id, feed_kind::updated);
}

folder copy_folder(database &store, const folder &source, const folder &destination,
                   std::int64_t now)
{
    check_destination(store, source, destination);
    check_storage(store, destination.account, totals_of(store, source.id).size);
    const std::string name = free_name(store, destination.id, source.name);
    folder made = copy_rows(store, source, destination, name, now);
    record_tree(store, made.id, feed_kind::updated);
    return made;
}

} // namespace emulator
