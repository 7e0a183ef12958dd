#include "store/file_entries.h"

#include <stdexcept>

#include "store/attachments.h"
#include "store/database.h"
#include "store/entry_keys.h"
#include "store/feed.h"
#include "store/names.h"
#include "store/usage.h"

namespace emulator {
namespace {

const std::string select_files = "SELECT id, key, link_key, account, folder, name, description,"
                                 " tags, privacy, created, modified, hash, size, downloads,"
                                 " deleted FROM files ";

file read_file_row(const statement &row)
{
    file read;
    read.id = row.number(0);
    read.key = row.text(1);
    read.link_key = row.text(2);
    read.account = row.number(3);
    read.folder = row.number(4);
    read.name = row.text(5);
    read.description = row.text(6);
    read.tags = row.text(7);
    read.privacy = row.text(8);
    read.created = row.number(9);
    read.modified = row.number(10);
    read.content = {row.text(11), static_cast<std::uint64_t>(row.number(12))};
    read.downloads = static_cast<std::uint64_t>(row.number(13));
    read.deleted = row.number(14);
    return read;
}

std::optional<file> first_of(statement query)
{
    if (!query.step())
        return std::nullopt;
    return read_file_row(query);
}

std::int64_t insert_file(database &store, const file &made)
{
    store
        .prepare("INSERT INTO files (key, link_key, account, folder, name, description, tags,"
                 " privacy, created, modified, hash, size)"
                 " VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)")
        .bind(std::string_view(made.key), std::string_view(made.link_key), made.account,
              made.folder, std::string_view(made.name), std::string_view(made.description),
              std::string_view(made.tags), std::string_view(made.privacy), made.created,
              made.modified, std::string_view(made.content.hash),
              static_cast<std::int64_t>(made.content.size))
        .run();
    return store.last_row();
}

} // namespace

std::optional<file> find_file(database &store, std::string_view key)
{
    statement query = store.prepare(select_files + "WHERE key = ?");
    query.bind(key);
    return first_of(std::move(query));
}

std::optional<file> find_file_by_link(database &store, std::string_view link_key)
{
    statement query = store.prepare(select_files + "WHERE link_key = ? AND deleted IS NULL");
    query.bind(link_key);
    return first_of(std::move(query));
}

file file_of_id(database &store, std::int64_t id)
{
    statement query = store.prepare(select_files + "WHERE id = ?");
    query.bind(id);
    const std::optional<file> found = first_of(std::move(query));
    if (!found)
        throw std::logic_error("a file that does not exist");
    return *found;
}

std::optional<file> find_file_in(database &store, std::int64_t folder, std::string_view name)
{
    statement query =
        store.prepare(select_files + "WHERE folder = ? AND name = ? AND deleted IS NULL");
    query.bind(folder, name);
    return first_of(std::move(query));
}

std::vector<file> files_in(database &store, std::int64_t folder)
{
    std::vector<file> all;
    statement query =
        store.prepare(select_files + "WHERE folder = ? AND deleted IS NULL ORDER BY id");
    query.bind(folder);
    while (query.step())
        all.push_back(read_file_row(query));
    return all;
}

file create_file(database &store, const folder &in, const new_file &asked)
{
    check_name_is_free(store, in.id, asked.name);
    file made;
    made.key = new_quick_key();
    made.link_key = new_link_key();
    made.account = in.account;
    made.folder = in.id;
    made.name = asked.name;
    made.privacy = in.privacy;
    made.created = asked.now;
    made.modified = asked.modified;
    made.id = insert_file(store, made);
    record_file(store, made.id, in.id, feed_kind::updated);
    return made;
}

void put_content(database &store, const file &target, const content_id &content,
                 std::int64_t modified)
{
    if (content.size > target.content.size)
        check_storage(store, target.account, content.size - target.content.size);
    store.prepare("UPDATE files SET hash = ?, size = ?, modified = ? WHERE id = ?")
        .bind(std::string_view(content.hash), static_cast<std::int64_t>(content.size), modified,
              target.id)
        .run();
    record_file(store, target.id, target.folder, feed_kind::updated);
}

void update_file(database &store, const file &target, const metadata_change &change)
{
    if (change.is_empty())
        return;
    if (change.name)
        check_name_is_free(store, target.folder, *change.name, target.key);
    const std::string name = change.name.value_or(target.name);
    const std::string description = change.description.value_or(target.description);
    const std::string tags = change.tags.value_or(target.tags);
    const std::string privacy = change.privacy.value_or(target.privacy);
    store
        .prepare("UPDATE files SET name = ?, description = ?, tags = ?, privacy = ?,"
                 " modified = ? WHERE id = ?")
        .bind(std::string_view(name), std::string_view(description), std::string_view(tags),
              std::string_view(privacy), change.modified.value_or(target.modified), target.id)
        .run();
    record_file(store, target.id, target.folder, feed_kind::updated);
}

void delete_file(database &store, const file &target, std::int64_t now)
{
    record_file(store, target.id, target.folder, feed_kind::deleted);
    store.prepare("UPDATE files SET deleted = ? WHERE id = ?").bind(now, target.id).run();
}

void move_file(database &store, const file &source, const folder &destination)
{
    check_name_is_free(store, destination.id, source.name, source.key);
    const view_change seen(viewers_of(store, source.folder), viewers_of(store, destination.id));
    for (const std::int64_t account : seen.lost())
        record_for(store, account, feed_scope::file, source.id, feed_kind::deleted);
    store.prepare("UPDATE files SET folder = ? WHERE id = ?").bind(destination.id, source.id).run();
    record_file(store, source.id, destination.id, feed_kind::updated);
}

file copy_file(database &store, const file &source, const folder &destination, std::int64_t now)
{
    check_storage(store, destination.account, source.content.size);
    const std::string name = free_name(store, destination.id, source.name);
    file made = copy_file_row(store, source, destination, name, now);
    record_file(store, made.id, destination.id, feed_kind::updated);
    return made;
}

file copy_file_row(database &store, const file &source, const folder &into, const std::string &name,
                   std::int64_t now)
{
    file made = source;
    made.key = new_quick_key();
    made.link_key = new_link_key();
    made.account = into.account;
    made.folder = into.id;
    made.name = name;
    made.created = now;
    made.downloads = 0;
    made.id = insert_file(store, made);
    return made;
}

void count_download(database &store, const file &target)
{
    store.prepare("UPDATE files SET downloads = downloads + 1 WHERE id = ?").bind(target.id).run();
}

} // namespace emulator
