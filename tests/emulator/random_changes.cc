#include "random_changes.h"

#include <sstream>

namespace {

std::ostream &operator<<(std::ostream &out, const account_entry &entry)
{
    out << "below " << entry.parent << " at " << entry.revision;
    for (const auto &[name, value] : entry.info)
        out << ", " << name << " " << value;
    return out;
}

} // namespace

std::string difference(const entries &known, const entries &listed)
{
    std::ostringstream lines;
    for (const auto &[key, entry] : known)
        if (listed.count(key) == 0)
            lines << "known but not listed: " << key << ' ' << entry << '\n';
        else if (!(listed.at(key) == entry))
            lines << "known: " << key << ' ' << entry << "\nlisted: " << listed.at(key) << '\n';
    for (const auto &[key, entry] : listed)
        if (known.count(key) == 0)
            lines << "listed but not known: " << key << ' ' << entry << '\n';
    return lines.str();
}

void random_changes::learn(const std::string &who, const entries &known)
{
    folders_[who].clear();
    files_[who].clear();
    // By revision, since keys are different in every run.
    std::map<std::uint64_t, std::string> ordered;
    for (const auto &[key, entry] : known)
        ordered.emplace(std::stoull(entry.revision), key);
    for (const auto &[revision, key] : ordered)
        (known.at(key).info.at("kind") == "folder" ? folders_ : files_)[who].push_back(key);
}

bool random_changes::change(const std::string &who, const std::string &other)
{
    const std::string name = "n" + std::to_string(below(40));
    switch (below(16)) {
    case 0:
    case 1:
    case 2:
        return tell(who, "folder/create", {{"foldername", name}, {"parent_key", folder(who)}});
    case 3:
    case 4:
    case 5:
    case 6:
        return tell(who, "file/create", {{"filename", name}, {"parent_key", folder(who)}});
    case 7:
        return tell(who, "folder/update",
                    {{"folder_key", folder(who)}, {"foldername", name}, {"tags", name}});
    case 8:
        return tell(who, "file/update", {{"quick_key", file(who)}, {"filename", name}});
    case 9:
        return tell(who, "folder/update",
                    {{"folder_key", folder(who)},
                     {"privacy", below(3) == 0 ? "private" : "public"},
                     {"privacy_recursive", below(2) == 0 ? "yes" : "no"}});
    case 10:
        return tell(who, "folder/move",
                    {{"folder_key_src", folder(who)}, {"folder_key_dst", folder(who)}});
    case 11:
        return tell(who, "file/move", {{"quick_key", file(who)}, {"folder_key", folder(who)}});
    case 12:
        return files_[who].size() < 300 &&
               tell(who, "folder/copy",
                    {{"folder_key_src", folder(who)}, {"folder_key_dst", folder(who)}});
    case 13:
        return tell(who, below(3) == 0 ? "folder/delete" : "file/delete",
                    {{"folder_key", folder(who)}, {"quick_key", file(who)}});
    case 14:
        return tell(who, "folder/attach_foreign", {{"folder_key", folder(other)}});
    default:
        return tell(who, "folder/detach_foreign", {{"folder_key", folder(who)}});
    }
}

std::uint32_t random_changes::below(std::uint32_t end)
{
    return static_cast<std::uint32_t>(random_() % end);
}

std::string random_changes::one_of(const std::vector<std::string> &keys)
{
    return keys.empty() ? "" : keys[below(static_cast<std::uint32_t>(keys.size()))];
}

bool random_changes::tell(const std::string &who, const std::string &name,
                          const std::vector<std::pair<std::string, std::string>> &given)
{
    const change_outcome outcome = act_(who, name, given);
    if (!outcome.new_folder.empty())
        folders_[who].push_back(outcome.new_folder);
    if (!outcome.new_file.empty())
        files_[who].push_back(outcome.new_file);
    return outcome.is_granted;
}
