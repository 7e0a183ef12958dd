#include "local_folder.h"

#include <cerrno>

#include <fcntl.h>
#include <sys/stat.h>

#include "../failure.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

constexpr int folder_flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;

descriptor opened_folder(int folder, const std::string &name, int more_flags,
                         const std::string &path)
{
    descriptor opened(::openat(folder, name.c_str(), folder_flags | more_flags));
    if (!opened)
        throw file_failure("cannot use the folder " + path, errno);
    return opened;
}

} // namespace

local_folder::local_folder(const std::string &path)
    : local_folder(path, opened_folder(AT_FDCWD, path, 0, path))
{
}

local_folder local_folder::again() const { return {path_, opened_folder(number(), ".", 0, path_)}; }

local_folder local_folder::enter(const std::string &name) const
{
    check_local_name(name);
    const std::string path = path_of(name);
    if (::mkdirat(number(), name.c_str(), 0777) != 0 && errno != EEXIST)
        throw file_failure("cannot make the folder " + path, errno);
    return {path, opened_folder(number(), name, O_NOFOLLOW, path)};
}

std::optional<local_folder> local_folder::find(const std::string &name) const
{
    check_local_name(name);
    descriptor opened(::openat(number(), name.c_str(), folder_flags | O_NOFOLLOW));
    if (!opened && errno != ENOENT && errno != ENOTDIR && errno != ELOOP)
        throw file_failure("cannot use the folder " + path_of(name), errno);
    if (!opened)
        return std::nullopt;
    return local_folder(path_of(name), std::move(opened));
}

local_entry local_folder::entry(const std::string &name) const
{
    struct stat facts = {};
    if (::fstatat(number(), name.c_str(), &facts, AT_SYMLINK_NOFOLLOW) != 0) {
        if (errno != ENOENT)
            throw file_failure("cannot use the name " + path_of(name), errno);
        return local_entry::nothing;
    }
    if (S_ISREG(facts.st_mode))
        return local_entry::file;
    return S_ISDIR(facts.st_mode) ? local_entry::folder : local_entry::other;
}

bool local_folder::has(const std::string &name, const expected_content &content) const
{
    const descriptor file(
        ::openat(number(), name.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    struct stat facts = {};
    if (!file || ::fstat(file.number(), &facts) != 0 || !S_ISREG(facts.st_mode) ||
        static_cast<std::uint64_t>(facts.st_size) != content.size)
        return false;
    sha256_sum sum;
    const auto add = [&sum](std::string_view piece) { sum.add(piece); };
    if (!read_pieces(file.number(), add))
        return false;
    return hex_of(sum.finish()) == content.sha256;
}

std::string local_folder::path_of(const std::string &name) const
{
    return path_ + (ends_with(path_, "/") ? "" : "/") + name;
}

void check_local_name(const std::string &name)
{
    if (name.empty() || name == "." || name == ".." || name.find('/') != std::string::npos ||
        name.find('\0') != std::string::npos)
        throw failure(exit_code::local_file,
                      "the service has a name that no file here can have: \"" + name + "\"",
                      "give it another name with: quillmere mv, or get it under one");
}

} // namespace quillmere::tools
