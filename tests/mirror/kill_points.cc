// Calls to the system at which the program may be killed, ahead of them and behind them, as if the
// power went: the environment says at which of them, counted from 1, or what has just got its name.
// The linker puts these in their place.
#include <csignal>
#include <cstdarg>
#include <cstdlib>
#include <string>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

long chosen_point()
{
    const char *const text = std::getenv("QUILLMERE_TEST_KILL_AT");
    return text == nullptr ? 0 : std::atol(text);
}

const long chosen = chosen_point();
long passed_points = 0;

void pass_point()
{
    if (++passed_points == chosen)
        ::raise(SIGKILL);
}

template <class Result> Result passed(Result result)
{
    pass_point();
    return result;
}

const char *const chosen_name = std::getenv("QUILLMERE_TEST_KILL_WHEN_NAMED");

int named(int result, const char *new_name)
{
    if (chosen_name != nullptr && result == 0 && std::string(new_name) == chosen_name)
        ::raise(SIGKILL);
    return passed(result);
}

} // namespace

extern "C" {
ssize_t __real_write(int file, const void *bytes, size_t count);
int __real_fsync(int file);
int __real_openat(int folder, const char *name, int flags, ...);
int __real_mkdirat(int folder, const char *name, mode_t mode);
int __real_unlinkat(int folder, const char *name, int flags);
int __real_renameat(int from, const char *name, int to, const char *new_name);
int __real_renameat2(int from, const char *name, int to, const char *new_name, unsigned flags);

ssize_t __wrap_write(int file, const void *bytes, size_t count);
int __wrap_fsync(int file);
int __wrap_openat(int folder, const char *name, int flags, ...);
int __wrap_mkdirat(int folder, const char *name, mode_t mode);
int __wrap_unlinkat(int folder, const char *name, int flags);
int __wrap_renameat(int from, const char *name, int to, const char *new_name);
int __wrap_renameat2(int from, const char *name, int to, const char *new_name, unsigned flags);

// Of the bytes of the last call half have gone.
ssize_t __wrap_write(int file, const void *bytes, size_t count)
{
    pass_point();
    const bool is_last = passed_points + 1 == chosen;
    return passed(__real_write(file, bytes, is_last ? count / 2 : count));
}

int __wrap_fsync(int file)
{
    pass_point();
    return passed(__real_fsync(file));
}

// Only a call that makes something can be ended in a way that matters.
int __wrap_openat(int folder, const char *name, int flags, ...)
{
    if ((flags & O_CREAT) == 0)
        return __real_openat(folder, name, flags);
    va_list more;
    va_start(more, flags);
    const mode_t mode = va_arg(more, mode_t);
    va_end(more);
    pass_point();
    return passed(__real_openat(folder, name, flags, mode));
}

int __wrap_mkdirat(int folder, const char *name, mode_t mode)
{
    pass_point();
    return passed(__real_mkdirat(folder, name, mode));
}

int __wrap_unlinkat(int folder, const char *name, int flags)
{
    pass_point();
    return passed(__real_unlinkat(folder, name, flags));
}

int __wrap_renameat(int from, const char *name, int to, const char *new_name)
{
    pass_point();
    return named(__real_renameat(from, name, to, new_name), new_name);
}

int __wrap_renameat2(int from, const char *name, int to, const char *new_name, unsigned flags)
{
    pass_point();
    return named(__real_renameat2(from, name, to, new_name, flags), new_name);
}
}
