#include "store/folders.h"

#include <stdexcept>

#include "errors.h"
#include "store/database.h"
#include "store/entry_keys.h"
#include "store/feed.h"
#include "store/names.h"
#include "store/trees.h"

namespace emulator {
namespace {

const std::string select_folders = "SELECT id, key, account, parent, name, description, tags,"
                                   " privacy, created, modified, deleted FROM folders ";

folder read_folder(const statement &row)
{
    folder read;
    read.id = row.number(0);
    read.key = row.text(1);
    read.account = row.number(2);
    read.parent = row.number(3);
    read.name = row.text(4);
    read.description = row.text(5);
    read.tags = row.text(6);
    read.privacy = row.text(7);
    read.created = row.number(8);
    read.modified = row.number(9);
    read.deleted = row.number(10);
    return read;
}

void write_privacy_below(database &store, const folder &top, const std::string &privacy)
{
    const std::string held = "WITH RECURSIVE held (id) AS (VALUES (?1) UNION ALL SELECT f.id"
                             " FROM folders f JOIN held ON f.parent = held.id"
                             " WHERE f.deleted IS NULL) ";
    store
        .prepare(held + "UPDATE folders SET privacy = ?2 WHERE id IN held AND id != ?1"
                        " AND deleted IS NULL")
        .bind(top.id, std::string_view(privacy))
        .run();
    store.prepare(held + "UPDATE files SET privacy = ?2 WHERE folder IN held AND deleted IS NULL")
        .bind(top.id, std::string_view(privacy))
        .run();
}

} // namespace

void make_root(database &store, std::int64_t account, std::int64_t now)
{
    const std::string key = new_folder_key();
    store
        .prepare("INSERT INTO folders (key, account, name, privacy, created, modified)"
                 " VALUES (?1, ?2, 'My files', 'public', ?3, ?3)")
        .bind(std::string_view(key), account, now)
        .run();
}

folder root_of(database &store, std::int64_t account)
{
    statement query = store.prepare(select_folders + "WHERE account = ? AND parent IS NULL");
    if (!query.bind(account).step())
        throw std::logic_error("an account without a root");
    return read_folder(query);
}

std::optional<folder> find_folder(database &store, std::string_view key)
{
    statement query = store.prepare(select_folders + "WHERE key = ?");
    if (!query.bind(key).step())
        return std::nullopt;
    return read_folder(query);
}

folder folder_of_id(database &store, std::int64_t id)
{
    statement query = store.prepare(select_folders + "WHERE id = ?");
    if (!query.bind(id).step())
        throw std::logic_error("a folder that does not exist");
    return read_folder(query);
}

std::optional<folder> find_folder_in(database &store, std::int64_t parent, std::string_view name)
{
    statement query =
        store.prepare(select_folders + "WHERE parent = ? AND name = ? AND deleted IS NULL");
    if (!query.bind(parent, name).step())
        return std::nullopt;
    return read_folder(query);
}

std::vector<folder> folders_in(database &store, std::int64_t parent)
{
    std::vector<folder> all;
    statement query =
        store.prepare(select_folders + "WHERE parent = ? AND deleted IS NULL ORDER BY id");
    query.bind(parent);
    while (query.step())
        all.push_back(read_folder(query));
    return all;
}

std::int64_t insert_folder(database &store, const folder &made)
{
    store
        .prepare("INSERT INTO folders (key, account, parent, name, description, tags, privacy,"
                 " created, modified) VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?)")
        .bind(std::string_view(made.key), made.account, made.parent, std::string_view(made.name),
              std::string_view(made.description), std::string_view(made.tags),
              std::string_view(made.privacy), made.created, made.modified)
        .run();
    return store.last_row();
}

folder create_folder(database &store, const folder &parent, const new_folder &asked)
{
    check_name_is_free(store, parent.id, asked.name);
    check_depth(store, parent.id, 1);
    folder made;
    made.key = new_folder_key();
    made.account = parent.account;
    made.parent = parent.id;
    made.name = asked.name;
    made.privacy = parent.privacy;
    made.created = asked.now;
    made.modified = asked.modified;
    made.id = insert_folder(store, made);
    record_folder(store, made.id);
    return made;
}

void update_folder(database &store, const folder &target, const metadata_change &change,
                   bool recursive)
{
    if (change.is_empty())
        return;
    if (change.name)
        check_name_is_free(store, target.parent, *change.name, target.key);
    const std::string name = change.name.value_or(target.name);
    const std::string description = change.description.value_or(target.description);
    const std::string tags = change.tags.value_or(target.tags);
    const std::string privacy = change.privacy.value_or(target.privacy);
    store
        .prepare("UPDATE folders SET name = ?, description = ?, tags = ?, privacy = ?,"
                 " modified = ? WHERE id = ?")
        .bind(std::string_view(name), std::string_view(description), std::string_view(tags),
              std::string_view(privacy), change.modified.value_or(target.modified), target.id)
        .run();
    if (!change.privacy || !recursive)
        return record_folder(store, target.id);
    write_privacy_below(store, target, privacy);
    record_tree(store, target.id, feed_kind::updated);
}

} // namespace emulator
