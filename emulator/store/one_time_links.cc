#include "store/one_time_links.h"

#include "store/database.h"
#include "store/entry_keys.h"

namespace emulator {

std::string make_one_time_link(database &store, std::int64_t file, std::int64_t now)
{
    std::string link_key = new_link_key();
    store.prepare("DELETE FROM one_time_links WHERE expires <= ?").bind(now).run();
    store.prepare("INSERT INTO one_time_links (link_key, file, expires) VALUES (?, ?, ?)")
        .bind(std::string_view(link_key), file, now + one_time_link_lifetime)
        .run();
    return link_key;
}

std::optional<std::int64_t> find_one_time_link(database &store, std::string_view link_key,
                                               std::int64_t now)
{
    statement query =
        store.prepare("SELECT o.file FROM one_time_links o JOIN files f ON f.id = o.file"
                      " WHERE o.link_key = ? AND o.expires > ? AND f.deleted IS NULL");
    if (!query.bind(link_key, now).step())
        return std::nullopt;
    return query.number(0);
}

void spend_one_time_link(database &store, std::string_view link_key)
{
    store.prepare("DELETE FROM one_time_links WHERE link_key = ?").bind(link_key).run();
}

} // namespace emulator
