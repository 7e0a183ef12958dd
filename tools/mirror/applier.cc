#include "applier.h"

#include <algorithm>

#include "../failure.h"
#include "local_names.h"

namespace quillmere::tools {

void applier::apply(const plan &steps, const layout &wanted)
{
    wanted_ = &wanted;
    former_paths_.clear();
    each_of(steps.rescued, &applier::rescue);
    each_of(steps.let_go, &applier::let_go);
    each_of(steps.set_aside, &applier::set_aside);
    each_of(steps.left, &applier::leave);
    // What left its place is kept in mind before others come there, so that a run that is killed
    // then does not take the one for the other.
    if (!steps.set_aside.empty() || !steps.left.empty())
        keep_();
    each_of(steps.folders, &applier::place_folder);
    each_of(steps.moved, &applier::place_file);
    bring_all(steps.missing);
    std::vector<std::string> unwanted;
    for (const auto &[key, placed] : here_)
        if (placed.set_aside && !placed.is_folder() && wanted.find(key) == nullptr)
            unwanted.push_back(key);
    each_of(unwanted, &applier::discard);
    keep_();
}

void applier::each_of(const std::vector<std::string> &keys, step taken)
{
    for (const std::string &key : keys)
        report_.attempt([&] { (this->*taken)(key); });
}

// The file was changed while it was set aside, so that nobody knows where the user looks for it.
void applier::rescue(const std::string &key)
{
    const placement &placed = here_.at(key);
    keep_beside(aside(key), placed.name, {wanted_->root, placed.name});
    here_.erase(key);
}

void applier::let_go(const std::string &key)
{
    const placement placed = here_.at(key);
    here_.erase(key);
    if (wanted_->key_at(placed.parent, placed.name) != nullptr)
        return; // it will have to make way, which is told then
    const std::string path = path_of(placed, here_);
    report_.keep(entry_kind::file, path, path);
}

void applier::set_aside(const std::string &key)
{
    placement &placed = here_.at(key);
    const std::string path = path_of(placed, here_);
    move({placed.parent, placed.name}, aside(key));
    placed.set_aside = true;
    former_paths_[key] = path;
}

// What the user keeps in it keeps it in the copy.
void applier::leave(const std::string &key)
{
    const placement placed = here_.at(key);
    const std::string path = path_of(placed, here_);
    const location at = placed.set_aside ? aside(key) : location{placed.parent, placed.name};
    if (disk_.remove_folder(key, at)) {
        here_.erase(key);
        report_.add({mirror_action::removed, entry_kind::folder, key, path, {}, 0});
        return;
    }
    if (placed.set_aside)
        keep_beside(at, placed.name, {wanted_->root, placed.name});
    else if (wanted_->key_at(placed.parent, placed.name) == nullptr)
        report_.keep(entry_kind::folder, path, path);
    here_.erase(key);
}

void applier::place_folder(const std::string &key)
{
    if (!has_place_for(key))
        return;
    const wanted_entry &wanted = wanted_->entries.at(key);
    const location to = {wanted.parent, wanted.name};
    const bool is_here = here_.count(key) != 0;
    if (is_here) {
        make_way(to);
        move(aside(key), to);
    } else if (disk_.entry(to) != local_entry::folder) {
        make_way(to);
        disk_.make_folder(to);
    }
    const auto stamp = disk_.stamp(entry_kind::folder, to);
    here_[key] = {entry_kind::folder, wanted.parent, wanted.name, {}, stamp.value_or(file_stamp())};
    report_.add({is_here ? mirror_action::moved : mirror_action::made, entry_kind::folder, key,
                 wanted_->path_of(key), former_paths_[key], 0});
}

void applier::place_file(const std::string &key)
{
    if (!has_place_for(key))
        return;
    placement &placed = here_.at(key);
    const wanted_entry &wanted = wanted_->entries.at(key);
    const location to = {wanted.parent, wanted.name};
    make_way(to);
    move(aside(key), to);
    placed.set_aside = false;
    placed.parent = wanted.parent;
    placed.name = wanted.name;
    report_.add({mirror_action::moved, entry_kind::file, key, wanted_->path_of(key),
                 former_paths_[key], 0});
}

// Looked at once more: what is removed here is gone for good.
void applier::discard(const std::string &key)
{
    const placement &placed = here_.at(key);
    const auto stamp = disk_.stamp(entry_kind::file, aside(key));
    if (stamp && !(*stamp == placed.stamp)) {
        rescue(key);
        return;
    }
    if (stamp)
        disk_.remove_file(aside(key));
    const auto former = former_paths_.find(key);
    report_.add({mirror_action::removed,
                 entry_kind::file,
                 key,
                 former == former_paths_.end() ? placed.name : former->second,
                 {},
                 0});
    here_.erase(key);
}

void applier::bring_all(const std::vector<std::string> &keys)
{
    find_reusable();
    constexpr std::size_t at_once = linked_content::links_at_once;
    std::size_t brought = 0;
    for (std::size_t begin = 0; begin < keys.size(); begin += at_once) {
        std::vector<std::string> remote;
        for (std::size_t i = begin; i < std::min(begin + at_once, keys.size()); ++i)
            report_.attempt([&] {
                if (has_place_for(keys[i]) && !is_set_aside(keys[i]) && !is_at_hand(keys[i]))
                    remote.push_back(keys[i]);
            });
        fetch_all(remote);
        brought += at_once;
        if (brought < here_.size() / 10)
            continue; // the more there is, the longer it takes to write it down
        brought = 0;
        keep_();
    }
}

void applier::find_reusable()
{
    reusable_.clear();
    for (const auto &[key, placed] : here_)
        if (placed.set_aside && !placed.is_folder() && wanted_->find(key) == nullptr)
            reusable_[placed.content.sha256] = key;
}

// The bytes may be in the place already, or be those of a file that is to be removed.
bool applier::is_at_hand(const std::string &key)
{
    const wanted_entry &wanted = wanted_->entries.at(key);
    if (here_.count(key) == 0 && disk_.has({wanted.parent, wanted.name}, wanted.content)) {
        record_file(key);
        return true;
    }
    const auto reusable = reusable_.find(wanted.content.sha256);
    if (reusable == reusable_.end())
        return false;
    const std::string other = reusable->second;
    reusable_.erase(reusable);
    if (!disk_.has(aside(other), wanted.content))
        return false;
    put_into_place(key, aside(other));
    here_.erase(other);
    report_.add({mirror_action::moved, entry_kind::file, key, wanted_->path_of(key),
                 former_paths_[other], 0});
    return true;
}

void applier::fetch_all(const std::vector<std::string> &keys)
{
    std::vector<std::string> linked;
    for (const std::string &key : keys)
        if (wanted_->entries.at(key).content.size > 0)
            linked.push_back(key);
    bool asked = linked.empty();
    report_.attempt([&] {
        if (!asked)
            disk_.expect(linked);
        asked = true;
    });
    if (asked)
        each_of(keys, &applier::fetch);
}

void applier::fetch(const std::string &key)
{
    const wanted_entry &wanted = wanted_->entries.at(key);
    const std::string path = path_below(report_.remote_path(), wanted_->path_of(key));
    if (!is_sha256_hex(wanted.content.sha256))
        throw failure(exit_code::refused, "the service does not tell the hash of " + path);
    disk_.fetch({key, path, wanted.content},
                [&](const location &arrived) { put_into_place(key, arrived); });
    report_.add({mirror_action::fetched,
                 entry_kind::file,
                 key,
                 wanted_->path_of(key),
                 {},
                 wanted.content.size});
}

// In place of what the mirror wrote itself, and of nothing else.
void applier::put_into_place(const std::string &key, const location &from)
{
    const wanted_entry &wanted = wanted_->entries.at(key);
    const location to = {wanted.parent, wanted.name};
    const auto found = here_.find(key);
    const bool own =
        found != here_.end() && disk_.stamp(entry_kind::file, to) == found->second.stamp;
    if (own) {
        disk_.move_over(from, to);
    } else {
        make_way(to);
        move(from, to);
    }
    record_file(key);
}

void applier::record_file(const std::string &key)
{
    const wanted_entry &wanted = wanted_->entries.at(key);
    const auto stamp = disk_.stamp(entry_kind::file, {wanted.parent, wanted.name});
    here_[key] = {entry_kind::file, wanted.parent, wanted.name, wanted.content,
                  stamp.value_or(file_stamp())};
}

// What could not be put into place, or could not leave it, has been told already.
bool applier::has_place_for(const std::string &key) const
{
    const wanted_entry &wanted = wanted_->entries.at(key);
    const auto above = here_.find(wanted.parent);
    if (wanted.parent != wanted_->root && (above == here_.end() || above->second.set_aside))
        return false;
    const auto found = here_.find(key);
    return found == here_.end() || found->second.set_aside ||
           found->second.is_at(wanted.parent, wanted.name);
}

bool applier::is_set_aside(const std::string &key) const
{
    const auto found = here_.find(key);
    return found != here_.end() && found->second.set_aside;
}

void applier::move(const location &from, const location &to)
{
    if (disk_.move(from, to))
        return;
    const std::string path = to.folder == own_folder
                                 ? std::string(mirror_folder_name) + "/" + to.name
                                 : local_path(to.folder, to.name);
    throw failure(exit_code::local_file, report_.local_path_of(path) + " is in the way");
}

void applier::make_way(const location &at)
{
    if (disk_.entry(at) != local_entry::nothing)
        keep_beside(at, local_path(at.folder, at.name), at);
}

void applier::keep_beside(const location &from, const std::string &former, const location &wanted)
{
    const entry_kind kind =
        disk_.entry(from) == local_entry::folder ? entry_kind::folder : entry_kind::file;
    for (unsigned number = 1;; ++number) {
        const location beside = {wanted.folder, name_beside(wanted.name, number)};
        if (wanted_->key_at(beside.folder, beside.name) != nullptr || !disk_.move(from, beside))
            continue;
        report_.keep(kind, local_path(beside.folder, beside.name), former);
        return;
    }
}

std::string applier::local_path(const std::string &parent, const std::string &name) const
{
    const std::string above = wanted_->path_of(parent);
    return above.empty() ? name : above + "/" + name;
}

} // namespace quillmere::tools
