#include "inspection.h"

#include <algorithm>
#include <map>
#include <optional>
#include <set>
#include <utility>
#include <vector>

namespace quillmere::tools {

namespace {

using place = std::pair<std::string, std::string>; // folder's key, and name

class inspector {
public:
    inspector(const local_copy &copy, const layout &wanted, placements &here)
        : copy_(copy), wanted_(wanted), here_(here), folders_(copy, wanted.root, here)
    {
    }

    void run()
    {
        forget_what_became_another_kind();
        locate_folders();
        locate_files();
        for (const std::string &key : wanted_.order)
            if (here_.count(key) == 0)
                adopt(key, wanted_.entries.at(key));
    }

private:
    enum class search { going_on, found, lost };
    enum class trust { in_stamps, in_names };

    std::vector<std::string> keys_of(entry_kind kind) const
    {
        std::vector<std::string> keys;
        for (const auto &[key, placed] : here_)
            if (placed.kind == kind)
                keys.push_back(key);
        return keys;
    }

    void forget_what_became_another_kind()
    {
        for (const auto &[key, placed] : here_) {
            const wanted_entry *const wanted = wanted_.find(key);
            if (wanted != nullptr && wanted->kind != placed.kind)
                lost_.insert(key);
        }
        forget_lost();
    }

    void forget_lost()
    {
        for (const std::string &key : lost_)
            here_.erase(key);
        lost_.clear();
    }

    // Where the one was and the other is wanted may lead in a circle, which ends at what is found
    // first. So the search is done again as long as it finds something, and names count only when
    // stamps have told all that they can.
    void locate_folders()
    {
        const std::vector<std::string> keys = keys_of(entry_kind::folder);
        for (const trust each : {trust::in_stamps, trust::in_names}) {
            trusted_ = each;
            for (std::size_t before = keys.size() + 1, lost = keys.size(); lost < before;) {
                before = lost;
                lost = count_lost(keys);
            }
        }
        for (const std::string &key : keys)
            if (!locate_folder(key))
                lost_.insert(key);
        forget_lost();
    }

    std::size_t count_lost(const std::vector<std::string> &keys)
    {
        for (auto each = searched_.begin(); each != searched_.end();)
            each = each->second == search::found ? std::next(each) : searched_.erase(each);
        return static_cast<std::size_t>(
            std::count_if(keys.begin(), keys.end(),
                          [this](const std::string &key) { return !locate_folder(key); }));
    }

    bool locate_folder(const std::string &key)
    {
        if (key == wanted_.root)
            return true;
        const auto found = here_.find(key);
        if (found == here_.end() || !found->second.is_folder())
            return false;
        const auto [known, is_new] = searched_.emplace(key, search::going_on);
        if (!is_new)
            return known->second == search::found; // what leads back to itself leads nowhere
        const bool is_there = search_folder(key, found->second);
        searched_[key] = is_there ? search::found : search::lost;
        return is_there;
    }

    // The recorded place, set aside, the wanted place; at last the recorded place by its name
    // alone, for a copy that was itself copied, unless the name is for another one now.
    bool search_folder(const std::string &key, placement &placed)
    {
        const wanted_entry *const wanted = wanted_.find(key);
        const place recorded = {placed.parent, placed.name};
        if (stamp_of_folder(copy_.own(), local_copy::aside_name(key))) {
            placed.set_aside = true;
            return true;
        }
        const bool was_aside = placed.set_aside;
        if (!was_aside && folder_stamp_at(recorded) == placed.stamp)
            return true;
        if (wanted != nullptr && folder_stamp_at({wanted->parent, wanted->name}) == placed.stamp) {
            placed.set_aside = false;
            placed.parent = wanted->parent;
            placed.name = wanted->name;
            return true;
        }
        const std::string *const other = wanted_.key_at(recorded.first, recorded.second);
        if (trusted_ == trust::in_stamps || was_aside || (other != nullptr && *other != key))
            return false;
        const auto stamp = folder_stamp_at(recorded);
        if (stamp)
            placed.stamp = *stamp;
        return stamp.has_value();
    }

    std::optional<file_stamp> folder_stamp_at(const place &where)
    {
        if (!locate_folder(where.first))
            return std::nullopt;
        const auto folder = folders_.find(where.first);
        return folder ? stamp_of_folder(*folder, where.second) : std::nullopt;
    }

    void locate_files()
    {
        std::vector<std::string> others;
        for (const std::string &key : keys_of(entry_kind::file))
            if (!find_by_stamp(key, here_.at(key)))
                others.push_back(key);
        for (const auto &[key, placed] : here_)
            if (!placed.set_aside && searched_.count(key) != 0)
                claimed_.emplace(placed.parent, placed.name);
        for (const std::string &key : others)
            if (!find_by_content(key, here_.at(key)))
                lost_.insert(key);
        forget_lost();
    }

    bool find_by_stamp(const std::string &key, placement &placed)
    {
        const wanted_entry *const wanted = wanted_.find(key);
        const place recorded = {placed.parent, placed.name};
        placed.changed_here = false;
        if (const auto stamp = stamp_of_file(copy_.own(), local_copy::aside_name(key))) {
            placed.set_aside = true;
            const bool same = *stamp == placed.stamp ||
                              copy_.own().has(local_copy::aside_name(key), placed.content);
            judge(placed, same, *stamp);
            return true;
        }
        const bool was_aside = std::exchange(placed.set_aside, false);
        if (!was_aside && file_stamp_at(recorded) == placed.stamp)
            return claim(placed);
        if (wanted == nullptr || !(file_stamp_at({wanted->parent, wanted->name}) == placed.stamp)) {
            placed.set_aside = was_aside;
            return false;
        }
        placed.parent = wanted->parent;
        placed.name = wanted->name;
        return claim(placed);
    }

    bool claim(const placement &placed)
    {
        claimed_.emplace(placed.parent, placed.name);
        return true;
    }

    // A run that was killed may have brought the bytes that are wanted now. Other bytes at the
    // recorded place are the user's, unless they are those of another entry that is to be there.
    bool find_by_content(const std::string &key, placement &placed)
    {
        const wanted_entry *const wanted = wanted_.find(key);
        if (wanted != nullptr && is_free({wanted->parent, wanted->name}) &&
            has({wanted->parent, wanted->name}, wanted->content)) {
            const place where = {wanted->parent, wanted->name};
            placed = {entry_kind::file, where.first, where.second, wanted->content,
                      file_stamp_at(where).value_or(file_stamp())};
            return claim(placed);
        }
        const place recorded = {placed.parent, placed.name};
        const auto stamp = file_stamp_at(recorded);
        if (placed.set_aside || !stamp || !is_free(recorded))
            return false;
        const std::string *const other = wanted_.key_at(recorded.first, recorded.second);
        if (other != nullptr && *other != key && has(recorded, wanted_.entries.at(*other).content))
            return false;
        judge(placed, has(recorded, placed.content), *stamp);
        return claim(placed);
    }

    // What was changed here keeps the stamp of what was written: with its own it would pass for
    // that in the next run.
    static void judge(placement &placed, bool same, const file_stamp &stamp)
    {
        placed.changed_here = !same;
        if (same)
            placed.stamp = stamp;
    }

    bool is_free(const place &where) const { return claimed_.count(where) == 0; }

    std::optional<file_stamp> file_stamp_at(const place &where) const
    {
        const auto folder = folders_.find(where.first);
        return folder ? stamp_of_file(*folder, where.second) : std::nullopt;
    }

    bool has(const place &where, const expected_content &content) const
    {
        const auto folder = folders_.find(where.first);
        return folder && folder->has(where.second, content);
    }

    void adopt(const std::string &key, const wanted_entry &wanted)
    {
        const place where = {wanted.parent, wanted.name};
        if (claimed_.count(where) != 0)
            return;
        const auto folder = folders_.find(wanted.parent);
        if (!folder || (!wanted.is_folder() && !folder->has(wanted.name, wanted.content)))
            return;
        const auto stamp = wanted.is_folder() ? stamp_of_folder(*folder, wanted.name)
                                              : stamp_of_file(*folder, wanted.name);
        if (stamp)
            here_[key] = {wanted.kind, wanted.parent, wanted.name, wanted.content, *stamp};
    }

    const local_copy &copy_;
    const layout &wanted_;
    placements &here_;
    copy_folders folders_;
    trust trusted_ = trust::in_stamps;
    std::map<std::string, search> searched_;
    std::set<std::string> lost_;
    std::set<place> claimed_;
};

} // namespace

void inspect(const local_copy &copy, const layout &wanted, placements &here)
{
    inspector(copy, wanted, here).run();
}

} // namespace quillmere::tools
