#include "partial_file.h"

#include <cerrno>
#include <cstdio>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include "../failure.h"

namespace quillmere::tools {

// The digest is in the name, so that the beginning of other bytes is never taken for that of these,
// and a name of any length has room.
std::string partial_file::name_for(const expected_content &expected)
{
    return ".quillmere-" + expected.sha256 + ".part";
}

partial_file::partial_file(int folder, const expected_content &expected)
    : folder_(folder), expected_(expected), name_(name_for(expected))
{
    while (!open()) {
    }
    take_in_what_is_there();
    if (size_ > expected_.size)
        restart();
}

partial_file::~partial_file()
{
    if (!in_place_ && size_ == 0)
        ::unlinkat(folder_, name_.c_str(), 0);
}

// Whoever held the lock until now may have put the file in its place: then the name is another's,
// or nobody's, and has to be opened again.
bool partial_file::open()
{
    const int flags = O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY;
    file_ = descriptor(::openat(folder_, name_.c_str(), flags, 0666));
    struct stat opened = {};
    if (!file_ || ::fstat(file_.number(), &opened) != 0)
        throw file_failure("cannot write " + name_, errno);
    if (!S_ISREG(opened.st_mode))
        throw failure(exit_code::local_file, name_ + " is no file", "move it out of the way");
    if (::flock(file_.number(), LOCK_EX | LOCK_NB) != 0)
        throw failure(exit_code::local_file, "another process is downloading " + name_,
                      "wait until it has ended");
    struct stat named = {};
    return ::fstatat(folder_, name_.c_str(), &named, AT_SYMLINK_NOFOLLOW) == 0 &&
           named.st_dev == opened.st_dev && named.st_ino == opened.st_ino;
}

void partial_file::take_in_what_is_there()
{
    const auto take = [this](std::string_view piece) {
        sum_.add(piece);
        size_ += piece.size();
    };
    if (!read_pieces(file_.number(), take))
        throw file_failure("cannot read " + name_, errno);
}

void partial_file::append(std::string_view piece)
{
    if (!write_all(file_.number(), piece))
        throw file_failure("cannot write " + name_, errno);
    sum_.add(piece);
    size_ += piece.size();
}

void partial_file::restart()
{
    if (::ftruncate(file_.number(), 0) != 0 || ::lseek(file_.number(), 0, SEEK_SET) != 0)
        throw file_failure("cannot write " + name_, errno);
    sum_ = sha256_sum();
    size_ = 0;
}

bool partial_file::is_right()
{
    return size_ == expected_.size && hex_of(sum_.finish()) == expected_.sha256;
}

void partial_file::flush()
{
    if (::fsync(file_.number()) != 0)
        throw file_failure("cannot write " + name_, errno);
}

void partial_file::rename_to(const std::string &name)
{
    if (::renameat(folder_, name_.c_str(), folder_, name.c_str()) != 0)
        throw file_failure("cannot write " + name, errno);
    in_place_ = true;
}

} // namespace quillmere::tools
