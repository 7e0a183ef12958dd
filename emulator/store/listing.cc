#include "store/listing.h"

#include "store/database.h"

namespace emulator {
namespace {

// Folder ?1 as account ?2 sees it. What an account has attached lies in its root and nowhere else.
const std::string shown_folders =
    "SELECT id FROM folders WHERE parent = ?1 AND deleted IS NULL"
    " AND (?2 != 0 OR privacy = 'public')"
    " AND NOT EXISTS (SELECT 1 FROM attachments WHERE account = ?2 AND folder = folders.id)"
    " UNION ALL SELECT folder FROM attachments WHERE account = ?2"
    " AND ?1 = (SELECT id FROM folders WHERE account = ?2 AND parent IS NULL)";

const std::string shown_files = "FROM files WHERE folder = ?1 AND deleted IS NULL"
                                " AND (?2 != 0 OR privacy = 'public')";

std::uint64_t number_of(database &store, const std::string &sql, listing of)
{
    statement query = store.prepare(sql);
    query.bind(of.folder, of.viewer).step();
    return static_cast<std::uint64_t>(query.number(0));
}

std::vector<std::int64_t> ids(database &store, const std::string &sql, listing of,
                              listing_part part)
{
    std::vector<std::int64_t> all;
    statement query = store.prepare(sql + " ORDER BY id LIMIT ?3 OFFSET ?4");
    query.bind(of.folder, of.viewer, part.count, part.first);
    while (query.step())
        all.push_back(query.number(0));
    return all;
}

} // namespace

std::uint64_t count_folders(database &store, listing of)
{
    return number_of(store, "SELECT count(*) FROM (" + shown_folders + ")", of);
}

std::uint64_t count_files(database &store, listing of)
{
    return number_of(store, "SELECT count(*) " + shown_files, of);
}

std::uint64_t size_of_files(database &store, listing of)
{
    return number_of(store, "SELECT coalesce(sum(size), 0) " + shown_files, of);
}

std::vector<folder> list_folders(database &store, listing of, listing_part part)
{
    std::vector<folder> shown;
    for (const std::int64_t id : ids(store, shown_folders, of, part))
        shown.push_back(folder_of_id(store, id));
    return shown;
}

std::vector<file> list_files(database &store, listing of, listing_part part)
{
    std::vector<file> shown;
    for (const std::int64_t id : ids(store, "SELECT id " + shown_files, of, part))
        shown.push_back(file_of_id(store, id));
    return shown;
}

} // namespace emulator
