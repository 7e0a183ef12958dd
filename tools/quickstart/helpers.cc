#include "helpers.h"

#include <cerrno>
#include <cstdlib>

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <sys/syscall.h>
#include <sys/wait.h>

#include "../failure.h"

namespace quillmere::tools {

namespace {

constexpr int patience_milliseconds = 10000;
constexpr int report_descriptor = 3;

/** The signals that ask for an end, but for those that whoever started us wants ignored. */
sigset_t ending_signals()
{
    sigset_t set;
    ::sigemptyset(&set);
    for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
        struct sigaction current = {};
        ::sigaction(number, nullptr, &current);
        if (current.sa_handler != SIG_IGN)
            ::sigaddset(&set, number);
    }
    return set;
}

int opened(const std::string &path)
{
    return ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
}

// Runs between fork and exec in a process of one thread.
[[noreturn]] void become(const helper_command &what, const sigset_t &signals)
{
    // Even when we are killed, what we started must not stay.
    ::prctl(PR_SET_PDEATHSIG, SIGTERM);
    ::signal(SIGPIPE, SIG_DFL);
    ::sigprocmask(SIG_SETMASK, &signals, nullptr);
    const bool output = ::dup2(opened(what.output), STDOUT_FILENO) >= 0;
    const bool messages =
        what.messages.empty() || ::dup2(opened(what.messages), STDERR_FILENO) >= 0;
    const bool report =
        what.kept_descriptor < 0 || ::dup2(what.kept_descriptor, report_descriptor) >= 0;
    for (const auto &[name, value] : what.environment)
        value ? ::setenv(name.c_str(), value->c_str(), 1) : ::unsetenv(name.c_str());

    std::vector<char *> words = {const_cast<char *>(what.program.c_str())};
    for (const std::string &each : what.arguments)
        words.push_back(const_cast<char *>(each.c_str()));
    words.push_back(nullptr);
    if (output && messages && report)
        ::execv(what.program.c_str(), words.data());
    ::_exit(127);
}

} // namespace

awaited_signals::awaited_signals()
{
    const sigset_t ending = ending_signals();
    ::sigprocmask(SIG_BLOCK, &ending, &former_);
    signals_ = descriptor(::signalfd(-1, &ending, SFD_CLOEXEC | SFD_NONBLOCK));
    if (!signals_)
        throw file_failure("cannot wait for signals", errno);
}

awaited_signals::~awaited_signals() { ::sigprocmask(SIG_SETMASK, &former_, nullptr); }

void awaited_signals::wait_for(int readable) const
{
    for (;;) {
        pollfd both[] = {{signals_.number(), POLLIN, 0}, {readable, POLLIN, 0}};
        if (::poll(both, 2, -1) < 0 && errno != EINTR)
            throw file_failure("cannot wait", errno);
        signalfd_siginfo arrived = {};
        if (::read(signals_.number(), &arrived, sizeof arrived) == sizeof arrived)
            throw asked_to_end{static_cast<int>(arrived.ssi_signo)};
        if (both[1].revents != 0)
            return;
    }
}

helper::helper(const helper_command &what, const awaited_signals &signals)
    : signals_(signals), pid_(::fork())
{
    if (pid_ == 0)
        become(what, signals.former());
    if (pid_ < 0)
        throw file_failure("cannot start " + what.program, errno);
    alive_ = descriptor(static_cast<int>(::syscall(SYS_pidfd_open, pid_, 0)));
    if (!alive_) {
        const int problem = errno;
        stop();
        throw file_failure("cannot watch " + what.program, problem);
    }
}

helper::~helper() { stop(); }

int helper::wait()
{
    signals_.wait_for(alive_.number());
    collect();
    return WIFEXITED(status_) ? WEXITSTATUS(status_) : 128 + WTERMSIG(status_);
}

void helper::stop()
{
    if (pid_ < 0)
        return;
    ::kill(pid_, SIGTERM);
    pollfd ended = {alive_.number(), POLLIN, 0};
    // The signals that could interrupt this are blocked.
    if (::poll(&ended, alive_ ? 1 : 0, patience_milliseconds) == 0)
        ::kill(pid_, SIGKILL);
    collect();
}

void helper::collect()
{
    while (::waitpid(pid_, &status_, 0) < 0 && errno == EINTR)
        continue;
    pid_ = -1;
}

} // namespace quillmere::tools
