#include "local_copy.h"

#include <cerrno>
#include <cstdio>
#include <memory>
#include <vector>

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include "../failure.h"
#include "../text.h"
#include "local_names.h"

namespace quillmere::tools {

namespace {

local_folder made_folder(const std::string &path)
{
    if (::mkdir(path.c_str(), 0777) != 0 && errno != EEXIST)
        throw file_failure("cannot make the folder " + path, errno);
    return local_folder(path);
}

struct closer {
    void operator()(DIR *open) const { ::closedir(open); }
};

bool look(const local_folder &folder, const std::string &name, struct stat &facts)
{
    if (::fstatat(folder.number(), name.c_str(), &facts, AT_SYMLINK_NOFOLLOW) == 0)
        return true;
    if (errno != ENOENT)
        throw file_failure("cannot use the name " + folder.path_of(name), errno);
    return false;
}

std::int64_t nanoseconds_of(const timespec &time)
{
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

} // namespace

local_copy::local_copy(const std::string &path)
    : top_(made_folder(path)), own_(top_->enter(mirror_folder_name)), may_be_changed_(true)
{
    ::fchmod(own_->number(), 0700);
    lock(LOCK_EX);
}

local_copy local_copy::to_look_at(const std::string &path)
{
    local_copy copy;
    if (::access(path.c_str(), F_OK) != 0 && errno == ENOENT)
        return copy;
    copy.top_.emplace(path);
    copy.own_ = copy.top_->find(mirror_folder_name);
    if (copy.is_begun())
        copy.lock(LOCK_SH);
    return copy;
}

void local_copy::lock(int kind) const
{
    if (::flock(own_->number(), kind | LOCK_NB) != 0)
        throw failure(exit_code::local_file, "another process is mirroring into " + top_->path());
}

void local_copy::clear_downloads() const
{
    for (const std::string &name : names_in(*own_))
        if (starts_with(name, ".quillmere-") && ends_with(name, ".part"))
            ::unlinkat(own_->number(), name.c_str(), 0);
}

std::optional<local_folder> copy_folders::find(const std::string &key) const
{
    if (key == root_)
        return copy_.exists() ? std::optional(copy_.top().again()) : std::nullopt;
    const auto found = here_.find(key);
    if (found == here_.end() || !found->second.is_folder())
        return std::nullopt;
    const placement &placed = found->second;
    if (placed.set_aside)
        return copy_.own().find(local_copy::aside_name(key));
    const std::optional<local_folder> above = find(placed.parent);
    return above ? above->find(placed.name) : std::nullopt;
}

local_folder copy_folders::open(const std::string &key) const
{
    std::optional<local_folder> found = find(key);
    if (!found)
        throw failure(exit_code::local_file, "a folder of the copy is gone",
                      "run the command again");
    return std::move(*found);
}

std::string path_of(const placement &placed, const placements &here)
{
    const auto above = here.find(placed.parent);
    if (placed.set_aside || above == here.end())
        return placed.name;
    return path_of(above->second, here) + "/" + placed.name;
}

std::vector<std::string> names_in(const local_folder &folder)
{
    const std::unique_ptr<DIR, closer> open(
        ::fdopendir(::openat(folder.number(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC)));
    if (!open)
        throw file_failure("cannot read the folder " + folder.path(), errno);
    std::vector<std::string> names;
    while (const dirent *each = ::readdir(open.get()))
        names.emplace_back(each->d_name);
    return names;
}

std::optional<file_stamp> stamp_of_file(const local_folder &folder, const std::string &name)
{
    struct stat facts = {};
    if (!look(folder, name, facts) || !S_ISREG(facts.st_mode))
        return std::nullopt;
    return file_stamp{facts.st_ino, static_cast<std::uint64_t>(facts.st_size),
                      nanoseconds_of(facts.st_mtim)};
}

std::optional<file_stamp> stamp_of_folder(const local_folder &folder, const std::string &name)
{
    struct stat facts = {};
    if (!look(folder, name, facts) || !S_ISDIR(facts.st_mode))
        return std::nullopt;
    return file_stamp{facts.st_ino, 0, 0};
}

bool move_to_free_name(const local_folder &from, const std::string &name, const local_folder &to,
                       const std::string &new_name)
{
    const auto moved = [&](unsigned flags) {
        return ::renameat2(from.number(), name.c_str(), to.number(), new_name.c_str(), flags) == 0;
    };
    if (moved(RENAME_NOREPLACE))
        return true;
    if (errno == EEXIST)
        return false;
    // A file system may not know how to look and move at once.
    if (errno == EINVAL && to.entry(new_name) != local_entry::nothing)
        return false;
    if (errno != EINVAL || !moved(0))
        throw file_failure("cannot move " + from.path_of(name) + " to " + to.path_of(new_name),
                           errno);
    return true;
}

void move_over(const local_folder &from, const std::string &name, const local_folder &to,
               const std::string &new_name)
{
    if (::renameat(from.number(), name.c_str(), to.number(), new_name.c_str()) != 0)
        throw file_failure("cannot write " + to.path_of(new_name), errno);
}

} // namespace quillmere::tools
