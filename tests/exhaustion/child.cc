#include "exhaustion/child.h"

#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>

#include "support/descriptor.h"
#include "support/failure.h"

namespace quillmere_test {
namespace {

descriptor memory_file(const char *name)
{
    descriptor file(::memfd_create(name, MFD_CLOEXEC));
    require(bool(file), "memfd_create");
    return file;
}

std::string whole_content(const descriptor &file)
{
    std::string content(static_cast<size_t>(::lseek(file.number(), 0, SEEK_END)), '\0');
    ssize_t count = ::pread(file.number(), content.data(), content.size(), 0);
    require(count == static_cast<ssize_t>(content.size()), "pread");
    return content;
}

[[noreturn]] void work_and_tell(const std::function<std::string()> &work, const descriptor &told,
                                const descriptor &err)
{
    const rlimit no_core = {0, 0};
    ::setrlimit(RLIMIT_CORE, &no_core);
    ::dup2(err.number(), STDERR_FILENO);
    ::alarm(static_cast<unsigned>(patience.count()));
    const std::string text = work();
    bool whole = ::write(told.number(), text.data(), text.size()) >= 0;
    ::_exit(whole ? 0 : 1);
}

} // namespace

child_end in_child(const std::function<std::string()> &work)
{
    const descriptor told = memory_file("told");
    const descriptor err = memory_file("err");
    std::fflush(nullptr); // what is buffered is not for the child to write
    pid_t pid = ::fork();
    require(pid >= 0, "fork");
    if (pid == 0)
        work_and_tell(work, told, err);

    int status = 0;
    require(::waitpid(pid, &status, 0) == pid, "waitpid");
    child_end end = {std::nullopt, whole_content(told), whole_content(err)};
    if (WIFSIGNALED(status))
        end.signal = WTERMSIG(status);
    return end;
}

} // namespace quillmere_test
