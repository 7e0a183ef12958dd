#include "data_directory.h"

#include <cerrno>
#include <cstdlib>
#include <stdexcept>
#include <system_error>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

namespace emulator {

std::filesystem::path default_data_directory()
{
    const char *state = std::getenv("XDG_STATE_HOME");
    if (state && *state == '/') // a relative path there is to be ignored
        return std::filesystem::path(state) / "quillmere-emulator";
    const char *home = std::getenv("HOME");
    if (!home || !*home)
        throw std::runtime_error("neither XDG_STATE_HOME nor HOME is set: give --data");
    return std::filesystem::path(home) / ".local/state/quillmere-emulator";
}

data_directory::data_directory(const std::filesystem::path &path)
    : path_(std::filesystem::absolute(path).lexically_normal())
{
    if (path_.has_parent_path())
        std::filesystem::create_directories(path_.parent_path());
    if (::mkdir(path_.c_str(), S_IRWXU) != 0 && errno != EEXIST)
        throw std::system_error(errno, std::generic_category(), path_.string());
    if (!std::filesystem::is_directory(path_))
        throw std::system_error(ENOTDIR, std::generic_category(), path_.string());
}

descriptor data_directory::claim() const
{
    const std::string name = path_ / "lock";
    descriptor lock(::open(name.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (lock.number() < 0)
        throw std::system_error(errno, std::generic_category(), name);
    if (::flock(lock.number(), LOCK_EX | LOCK_NB) != 0) {
        if (errno != EWOULDBLOCK)
            throw std::system_error(errno, std::generic_category(), name);
        throw std::runtime_error("another quillmere-emulator is using " + path_.string());
    }
    return lock;
}

} // namespace emulator
