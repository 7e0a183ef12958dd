#include "dump.h"

#include <nlohmann/json.hpp>

#include "store/accounts.h"
#include "store/database.h"
#include "store/file_entries.h"
#include "store/folders.h"
#include "store/profiles.h"
#include "times.h"

namespace emulator {
namespace {

using json = nlohmann::ordered_json; // the order in which a reader wants it

json revision_part(database &store, const std::string &key, std::int64_t account)
{
    statement query = store.prepare("SELECT revision FROM feed WHERE account = ? AND key = ?");
    query.bind(account, std::string_view(key));
    return query.step() ? json(query.number(0)) : json(nullptr);
}

template <class Entry> json entry_part(database &store, const Entry &shown)
{
    return {{"key", shown.key},
            {"name", shown.name},
            {"revision", revision_part(store, shown.key, shown.account)},
            {"description", shown.description},
            {"tags", shown.tags},
            {"privacy", shown.privacy},
            {"created", time_text(shown.created)},
            {"mtime", time_text(shown.modified)}};
}

json file_part_of(database &store, const file &shown)
{
    json part = entry_part(store, shown);
    part["size"] = shown.content.size;
    part["hash"] = shown.content.hash;
    part["downloads"] = shown.downloads;
    return part;
}

json folder_part(database &store, const folder &shown)
{
    json part = entry_part(store, shown);
    part["folders"] = json::array();
    for (const folder &each : folders_in(store, shown.id))
        part["folders"].push_back(folder_part(store, each));
    part["files"] = json::array();
    for (const file &each : files_in(store, shown.id))
        part["files"].push_back(file_part_of(store, each));
    return part;
}

json feed_part(database &store, std::int64_t account)
{
    json feed = json::array();
    statement query = store.prepare("SELECT revision, key, is_folder, parent_key, deleted"
                                    " FROM feed WHERE account = ? ORDER BY revision");
    query.bind(account);
    while (query.step())
        feed.push_back({{"revision", query.number(0)},
                        {"key", query.text(1)},
                        {"kind", query.number(2) != 0 ? "folder" : "file"},
                        {"parent", query.text(3)},
                        {"change", query.number(4) != 0 ? "deleted" : "updated"}});
    return feed;
}

json attached_part(database &store, std::int64_t account)
{
    json keys = json::array();
    statement query = store.prepare("SELECT f.key FROM attachments a JOIN folders f"
                                    " ON f.id = a.folder WHERE a.account = ? ORDER BY f.id");
    query.bind(account);
    while (query.step())
        keys.push_back(query.text(0));
    return keys;
}

json usage_part(database &store, std::int64_t account)
{
    statement query = store.prepare("SELECT base_storage, bonus_storage, bandwidth_limit,"
                                    " bandwidth_used FROM accounts WHERE id = ?");
    query.bind(account).step();
    return {{"base_storage", query.number(0)},
            {"bonus_storage", query.number(1)},
            {"bandwidth_limit", query.number(2)},
            {"bandwidth_used", query.number(3)}};
}

json account_part(database &store, std::int64_t account)
{
    return {{"email", account_email(store, account)},
            {"revision", account_revision(store, account)},
            {"epoch", account_epoch(store, account)},
            {"profile", profile_of(store, account)},
            {"usage", usage_part(store, account)},
            {"attached", attached_part(store, account)},
            {"root", folder_part(store, root_of(store, account))},
            {"feed", feed_part(store, account)}};
}

} // namespace

std::string dump(database &store)
{
    const transaction one_state(store, transaction_kind::reads);
    json accounts = json::array();
    statement query = store.prepare("SELECT id FROM accounts ORDER BY id");
    while (query.step())
        accounts.push_back(account_part(store, query.number(0)));
    return json{{"accounts", accounts}}.dump(2) + '\n';
}

} // namespace emulator
