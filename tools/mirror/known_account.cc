#include "known_account.h"

#include <set>
#include <utility>

namespace quillmere::tools {

namespace {

using children_by_parent = std::multimap<std::string, std::string>;

children_by_parent children_of(const std::map<std::string, known_entry> &entries)
{
    children_by_parent children;
    for (const auto &[key, entry] : entries)
        children.emplace(entry.parent, key);
    return children;
}

std::set<std::string> reachable_from(const std::string &root, const children_by_parent &children)
{
    std::set<std::string> reached = {root};
    std::vector<std::string> waiting = {root};
    while (!waiting.empty()) {
        const auto [first, last] = children.equal_range(waiting.back());
        waiting.pop_back();
        for (auto each = first; each != last; ++each)
            if (reached.insert(each->second).second)
                waiting.push_back(each->second);
    }
    return reached;
}

} // namespace

void known_account::begin(std::uint64_t at_revision, std::string in_epoch)
{
    revision = at_revision;
    epoch = std::move(in_epoch);
    entries.clear();
    entries[root].described = true;
}

void known_account::apply(const std::vector<entry_change> &changes, std::uint64_t up_to)
{
    for (const entry_change &each : changes) {
        if (each.deleted) {
            entries.erase(each.key);
            continue;
        }
        if (each.key == root)
            continue; // where it is, and what it is called, does not matter
        known_entry &entry = entries[each.key];
        entry.kind = each.kind;
        entry.parent = each.parent;
        entry.described = false;
    }
    revision = up_to;
    forget_what_is_outside();
}

void known_account::add_listing(const std::string &folder,
                                const std::vector<std::pair<std::string, known_entry>> &found)
{
    for (const auto &[key, listed] : found) {
        const auto [known, is_new] = entries.try_emplace(key, listed);
        known_entry &entry = known->second;
        if (is_new) {
            entry.parent = folder;
            entry.listed = false;
        } else if (entry.parent == folder) {
            entry.name = listed.name;
            entry.content = listed.content;
        } else {
            continue;
        }
        entry.described = true;
    }
    entries[folder].listed = true;
}

std::vector<std::string> known_account::unfinished() const
{
    std::vector<std::string> keys;
    for (const auto &[key, entry] : entries)
        if (!entry.described || (entry.is_folder() && !entry.listed))
            keys.push_back(key);
    return keys;
}

void known_account::forget_what_is_outside()
{
    const std::set<std::string> inside = reachable_from(root, children_of(entries));
    for (auto each = entries.begin(); each != entries.end();)
        each = inside.count(each->first) == 0 ? entries.erase(each) : std::next(each);
}

} // namespace quillmere::tools
