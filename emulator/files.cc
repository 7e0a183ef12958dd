#include "files.h"

#include <cerrno>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace emulator {
namespace {

/** A name that is gone at the end of the scope, unless it has become another by then. */
class temporary_name {
public:
    explicit temporary_name(std::string path) : path_(std::move(path)) {}
    ~temporary_name() { ::unlink(path_.c_str()); }
    temporary_name(const temporary_name &) = delete;
    temporary_name &operator=(const temporary_name &) = delete;

    const std::string &path() const { return path_; }

private:
    std::string path_;
};

} // namespace

void fail_by_errno(const std::string &what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

descriptor::~descriptor()
{
    if (number_ >= 0)
        ::close(number_);
}

void write_all(int descriptor, std::string_view text)
{
    while (!text.empty()) {
        const ssize_t written = ::write(descriptor, text.data(), text.size());
        if (written < 0 && errno != EINTR)
            fail_by_errno("write");
        if (written > 0)
            text.remove_prefix(static_cast<std::size_t>(written));
    }
}

void write_file(const std::filesystem::path &path, std::string_view text, mode_t mode)
{
    // A temporary name of this process's own: two processes that write the same file both succeed.
    const temporary_name name(path.string() + "." + std::to_string(::getpid()) + ".new");
    const std::string &temporary = name.path();
    {
        const descriptor file(
            ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, mode));
        if (file.number() < 0)
            fail_by_errno(temporary);
        if (::fchmod(file.number(), mode) != 0) // whatever the umask says
            fail_by_errno(temporary);
        write_all(file.number(), text);
        if (::fsync(file.number()) != 0)
            fail_by_errno(temporary);
    }
    if (::rename(temporary.c_str(), path.c_str()) != 0)
        fail_by_errno(path.string());
}

std::string read_descriptor(int descriptor, std::size_t largest)
{
    std::string text;
    char piece[4096];
    for (;;) {
        const ssize_t got = ::read(descriptor, piece, sizeof piece);
        if (got < 0 && errno != EINTR)
            fail_by_errno("read");
        if (got == 0)
            return text;
        if (got > 0)
            text.append(piece, static_cast<std::size_t>(got));
        if (text.size() > largest)
            throw std::system_error(std::make_error_code(std::errc::file_too_large), "read");
    }
}

std::string read_file(const std::filesystem::path &path, std::size_t largest)
{
    const descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (file.number() < 0)
        fail_by_errno(path.string());
    return read_descriptor(file.number(), largest);
}

} // namespace emulator
