#include "private_file.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>

#include "descriptor.h"
#include "failure.h"
#include "interrupt.h"

namespace quillmere::tools {

namespace {

constexpr mode_t readable_by_others = S_IRGRP | S_IROTH | S_IXGRP | S_IXOTH;
constexpr mode_t writable_by_others = S_IWGRP | S_IWOTH;

std::string contents_of(const descriptor &file, const std::string &name)
{
    std::string text;
    if (!read_all(file.number(), largest_small_file, text))
        throw file_failure("cannot read " + name, errno);
    return text;
}

privacy ensure_private(const descriptor &file, const std::string &name)
{
    struct stat facts = {};
    if (::fstat(file.number(), &facts) != 0)
        throw file_failure("cannot examine " + name, errno);
    if (!S_ISREG(facts.st_mode))
        throw failure(exit_code::local_file, name + " is not a regular file",
                      "remove it, or name another");
    if (facts.st_uid != ::geteuid())
        throw failure(exit_code::local_file, name + " belongs to another user",
                      "remove it and sign in again");
    if ((facts.st_mode & writable_by_others) != 0)
        throw failure(exit_code::local_file, name + " can be written by other users",
                      "remove it and sign in again");
    if ((facts.st_mode & readable_by_others) == 0)
        return privacy::kept;
    if (::fchmod(file.number(), 0600) != 0)
        throw file_failure("cannot protect " + name, errno);
    return privacy::repaired;
}

// The directories above are made as the user's other directories are; the last one is private.
void make_private_directory(const std::filesystem::path &directory, folder_owner owner)
{
    std::error_code problem;
    std::filesystem::create_directories(directory.parent_path(), problem);
    if (::mkdir(directory.c_str(), 0700) == 0)
        return;
    struct stat facts = {};
    if (errno != EEXIST || ::stat(directory.c_str(), &facts) != 0 || !S_ISDIR(facts.st_mode))
        throw file_failure("cannot make the directory " + directory.string(), errno);
    if (owner == folder_owner::program && (facts.st_mode & 077) != 0 &&
        ::chmod(directory.c_str(), 0700) != 0)
        throw file_failure("cannot protect the directory " + directory.string(), errno);
}

/** A new file beside the one it is to replace, removed again unless it has taken its place. */
class replacement {
public:
    explicit replacement(std::string path) : path_(std::move(path)), name_(path_ + ".XXXXXX")
    {
        file_ = descriptor(::mkostemp(name_.data(), O_CLOEXEC)); // with mode 0600
    }
    replacement(const replacement &) = delete;
    replacement &operator=(const replacement &) = delete;
    ~replacement()
    {
        if (file_ && !in_place_)
            ::unlink(name_.c_str());
    }

    /** False with errno set when any step failed. */
    bool fill(const std::string &text)
    {
        return file_ && write_all(file_.number(), text) && ::fsync(file_.number()) == 0;
    }
    bool take_place()
    {
        in_place_ = std::rename(name_.c_str(), path_.c_str()) == 0;
        return in_place_;
    }

private:
    std::string path_;
    std::string name_;
    descriptor file_;
    bool in_place_ = false;
};

// Only then is the new name sure to survive a power cut. A file system that cannot do it has done
// what it can.
void sync_directory(const std::filesystem::path &directory)
{
    const descriptor opened(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (opened)
        ::fsync(opened.number());
}

} // namespace

std::string read_small_file(const std::string &path, const std::string &what)
{
    const std::string name = what + " " + path;
    const descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY));
    if (!file)
        throw file_failure("cannot open " + name, errno);
    return contents_of(file, name);
}

std::optional<private_text> read_private_file(const std::string &path, const std::string &what)
{
    const std::string name = what + " " + path;
    // O_NONBLOCK: a FIFO of that name must be refused, not waited for.
    const int flags = O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NOFOLLOW | O_NONBLOCK;
    const descriptor file(::open(path.c_str(), flags));
    if (!file && errno == ENOENT)
        return std::nullopt;
    if (!file)
        throw file_failure("cannot open " + name, errno);
    const privacy found = ensure_private(file, name);
    return private_text{contents_of(file, name), found};
}

void write_private_file(const std::string &path, const std::string &text, const std::string &what,
                        folder_owner folder)
{
    std::filesystem::path directory = std::filesystem::path(path).parent_path();
    if (directory.empty()) // of a path that is a name alone
        directory = ".";
    make_private_directory(directory, folder);

    // A signal that ended the process here would leave the new file behind.
    const interrupts_held whole;
    replacement successor(path);
    if (!successor.fill(text) || !successor.take_place())
        throw file_failure("cannot write " + what + " " + path, errno);
    sync_directory(directory);
}

void create_private_file(const std::string &path, const std::string &text, const std::string &what)
{
    const descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!file || !write_all(file.number(), text))
        throw file_failure("cannot write " + what + " " + path, errno);
}

bool remove_file(const std::string &path, const std::string &what)
{
    if (::unlink(path.c_str()) == 0)
        return true;
    if (errno != ENOENT)
        throw file_failure("cannot remove " + what + " " + path, errno);
    return false;
}

} // namespace quillmere::tools
