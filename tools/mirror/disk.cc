#include "disk.h"

#include <cerrno>

#include <fcntl.h>
#include <sys/stat.h>

#include "../failure.h"

namespace quillmere::tools {

local_folder real_disk::open(const std::string &key) const
{
    return key == own_folder ? copy_.own().again() : folders_.open(key);
}

local_entry real_disk::entry(const location &at) const { return open(at.folder).entry(at.name); }

bool real_disk::has(const location &at, const expected_content &content) const
{
    return open(at.folder).has(at.name, content);
}

std::optional<file_stamp> real_disk::stamp(entry_kind kind, const location &at) const
{
    const local_folder folder = open(at.folder);
    return kind == entry_kind::folder ? stamp_of_folder(folder, at.name)
                                      : stamp_of_file(folder, at.name);
}

bool real_disk::move(const location &from, const location &to)
{
    return move_to_free_name(open(from.folder), from.name, open(to.folder), to.name);
}

void real_disk::move_over(const location &from, const location &to)
{
    tools::move_over(open(from.folder), from.name, open(to.folder), to.name);
}

void real_disk::make_folder(const location &at)
{
    const local_folder above = open(at.folder);
    if (::mkdirat(above.number(), at.name.c_str(), 0777) != 0)
        throw file_failure("cannot make the folder " + above.path_of(at.name), errno);
}

bool real_disk::remove_folder(const std::string &, const location &at)
{
    const local_folder above = open(at.folder);
    if (::unlinkat(above.number(), at.name.c_str(), AT_REMOVEDIR) == 0 || errno == ENOENT)
        return true;
    if (errno != ENOTEMPTY && errno != EEXIST)
        throw file_failure("cannot remove " + above.path_of(at.name), errno);
    return false;
}

void real_disk::remove_file(const location &at)
{
    const local_folder above = open(at.folder);
    if (::unlinkat(above.number(), at.name.c_str(), 0) != 0)
        throw file_failure("cannot remove " + above.path_of(at.name), errno);
}

void real_disk::expect(const std::vector<std::string> &keys) { contents_.ask_for_links(keys); }

void real_disk::fetch(const wanted_bytes &file,
                      const std::function<void(const location &)> &put_into_place)
{
    partial_file partial(copy_.own().number(), file.content);
    if (file.content.size > 0)
        contents_.bring(file.key, file.path, partial);
    else if (!partial.is_right())
        throw failure(exit_code::unreadable_answer, "no empty file has the hash of " + file.path);
    partial.flush();
    put_into_place({own_folder, partial.name()});
    partial.left();
}

bool imagined_disk::has(const location &at, const expected_content &content) const
{
    const thing found = look(at);
    return found.origin && really(found.origin->folder)->has(found.origin->name, content);
}

std::optional<file_stamp> imagined_disk::stamp(entry_kind kind, const location &at) const
{
    const thing found = look(at);
    if (!found.origin)
        return std::nullopt;
    const auto folder = really(found.origin->folder);
    return kind == entry_kind::folder ? stamp_of_folder(*folder, found.origin->name)
                                      : stamp_of_file(*folder, found.origin->name);
}

bool imagined_disk::move(const location &from, const location &to)
{
    if (entry(to) != local_entry::nothing)
        return false;
    move_over(from, to);
    return true;
}

void imagined_disk::move_over(const location &from, const location &to)
{
    changed_[to] = look(from);
    changed_[from] = {};
}

void imagined_disk::make_folder(const location &at)
{
    changed_[at] = {local_entry::folder, std::nullopt};
}

bool imagined_disk::remove_folder(const std::string &key, const location &at)
{
    if (const auto folder = really(key))
        for (const std::string &name : names_in(*folder))
            if (name != "." && name != ".." && entry({key, name}) != local_entry::nothing)
                return false;
    changed_[at] = {};
    return true;
}

void imagined_disk::remove_file(const location &at) { changed_[at] = {}; }

void imagined_disk::fetch(const wanted_bytes &file,
                          const std::function<void(const location &)> &put_into_place)
{
    const location arrived = {own_folder, partial_file::name_for(file.content)};
    changed_[arrived] = {local_entry::file, std::nullopt};
    put_into_place(arrived);
}

imagined_disk::thing imagined_disk::look(const location &at) const
{
    const auto changed = changed_.find(at);
    if (changed != changed_.end())
        return changed->second;
    const auto folder = really(at.folder);
    const local_entry found = folder ? folder->entry(at.name) : local_entry::nothing;
    if (found == local_entry::nothing)
        return {};
    return {found, at};
}

// A folder stays where it was found, whatever has become of it, and may be one that was nobody's
// then.
std::optional<local_folder> imagined_disk::really(const std::string &key) const
{
    if (key == own_folder)
        return copy_.is_begun() ? std::optional(copy_.own().again()) : std::nullopt;
    std::optional<local_folder> found = folders_.find(key);
    const auto here = here_.find(key);
    if (found || here == here_.end() || here_at_first_.count(key) != 0)
        return found;
    const thing taken = look({here->second.parent, here->second.name});
    if (!taken.origin)
        return std::nullopt;
    return really(taken.origin->folder)->find(taken.origin->name);
}

} // namespace quillmere::tools
