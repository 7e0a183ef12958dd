#include "support/process.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/eventfd.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <optional>
#include <stdexcept>

#include "support/signals_blocked.h"

extern char **environ;

namespace quillmere_test {
namespace {

using clock = std::chrono::steady_clock;

// posix_spawn() and its kin return their error instead of setting errno.
void spawn_step(int error, const std::string &call)
{
    errno = error;
    require(error == 0, call);
}

class spawn_settings {
public:
    spawn_settings()
    {
        posix_spawn_file_actions_init(&actions_);
        posix_spawnattr_init(&attributes_);
        // The program starts as from a shell, whatever this thread blocks or ignores.
        sigset_t signals;
        sigemptyset(&signals);
        posix_spawnattr_setsigmask(&attributes_, &signals);
        sigaddset(&signals, SIGPIPE);
        sigaddset(&signals, SIGINT);
        sigaddset(&signals, SIGTERM);
        posix_spawnattr_setsigdefault(&attributes_, &signals);
        posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    }
    ~spawn_settings()
    {
        posix_spawnattr_destroy(&attributes_);
        posix_spawn_file_actions_destroy(&actions_);
    }
    spawn_settings(const spawn_settings &) = delete;
    spawn_settings &operator=(const spawn_settings &) = delete;

    void place(const descriptor &own, int childs)
    {
        spawn_step(posix_spawn_file_actions_adddup2(&actions_, own.number(), childs), "adddup2");
    }
    void enter(const std::string &folder)
    {
        spawn_step(posix_spawn_file_actions_addchdir_np(&actions_, folder.c_str()), "addchdir");
    }
    const posix_spawn_file_actions_t *actions() const { return &actions_; }
    const posix_spawnattr_t *attributes() const { return &attributes_; }

private:
    posix_spawn_file_actions_t actions_;
    posix_spawnattr_t attributes_;
};

// A file in memory rather than a pipe: a program that does not read it cannot hold us up.
descriptor input_file(std::string_view text)
{
    descriptor file(::memfd_create("input", MFD_CLOEXEC));
    require(bool(file), "memfd_create");
    while (!text.empty()) {
        ssize_t count = ::write(file.number(), text.data(), text.size());
        require(count > 0, "write");
        text.remove_prefix(static_cast<size_t>(count));
    }
    require(::lseek(file.number(), 0, SEEK_SET) == 0, "lseek");
    return file;
}

std::vector<std::string>
environment_with(const std::map<std::string, std::optional<std::string>> &changes)
{
    std::vector<std::string> variables;
    for (char **each = environ; *each; ++each) {
        std::string variable = *each;
        if (changes.count(variable.substr(0, variable.find('='))) == 0)
            variables.push_back(variable);
    }
    for (const auto &[name, value] : changes)
        if (value)
            variables.push_back(name + "=" + *value);
    return variables;
}

std::vector<char *> pointers_to(std::vector<std::string> &texts)
{
    std::vector<char *> pointers;
    for (std::string &text : texts)
        pointers.push_back(text.data());
    pointers.push_back(nullptr);
    return pointers;
}

std::optional<std::string> line_containing(const std::string &text, std::string_view wanted)
{
    size_t start = 0;
    for (size_t end; (end = text.find('\n', start)) != std::string::npos; start = end + 1) {
        std::string line = text.substr(start, end - start);
        if (line.find(wanted) != std::string::npos)
            return line;
    }
    return std::nullopt;
}

} // namespace

process::process(const command &what)
{
    end_ = descriptor(::eventfd(0, EFD_CLOEXEC));
    require(bool(end_), "eventfd");
    descriptor writers[3];
    for (size_t i = 0; i < 3; ++i) {
        int ends[2];
        require(::pipe2(ends, O_CLOEXEC) == 0, "pipe2");
        sources_[i].pipe = descriptor(ends[0]);
        writers[i] = descriptor(ends[1]);
        require(::fcntl(ends[0], F_SETFL, O_NONBLOCK) == 0, "fcntl");
    }
    start(what, writers);
    watch();
}

void process::start(const command &what, const descriptor (&writers)[3])
{
    descriptor input = input_file(what.input);
    spawn_settings settings;
    settings.place(input, STDIN_FILENO);
    settings.place(writers[0], STDOUT_FILENO);
    settings.place(writers[1], STDERR_FILENO);
    // Last, since one of the ends above may itself have this number.
    settings.place(writers[2], 3);
    if (!what.folder.empty())
        settings.enter(what.folder);
    std::vector<std::string> words = {what.program};
    words.insert(words.end(), what.arguments.begin(), what.arguments.end());
    std::vector<std::string> variables = environment_with(what.environment);
    spawn_step(posix_spawnp(&pid_, what.program.c_str(), settings.actions(), settings.attributes(),
                            pointers_to(words).data(), pointers_to(variables).data()),
               "start " + what.program);
}

// A thread turns the program's end into something that poll() can wait for. The kernel's own
// descriptors for processes would do so without one, but valgrind does not know them.
void process::watch()
{
    signals_blocked in_new_thread;
    watcher_ = std::thread([pid = pid_, end = end_.number()] {
        siginfo_t ignored;
        // Left to be reaped, so that nobody else gets its number before send_signal() knows.
        while (::waitid(P_PID, static_cast<id_t>(pid), &ignored, WEXITED | WNOWAIT) != 0)
            continue;
        ::eventfd_write(end, 1);
    });
}

process::~process()
{
    if (ended_)
        return;
    ::kill(pid_, SIGKILL);
    reap();
}

void process::send_signal(int number) const
{
    // Until it is reaped the number cannot belong to anybody else.
    if (!ended_)
        require(::kill(pid_, number) == 0, "kill");
}

std::string process::wait_for_line(channel from, std::string_view containing,
                                   std::chrono::milliseconds deadline)
{
    source &watched = sources_[static_cast<size_t>(from)];
    auto until = clock::now() + deadline;
    for (;;) {
        if (auto line = line_containing(watched.text, containing))
            return *line;
        if (ended_ || !pump(until))
            throw std::runtime_error("no line with \"" + std::string(containing) + "\" in:\n" +
                                     everything_written());
    }
}

outcome process::wait(std::chrono::milliseconds deadline)
{
    auto until = clock::now() + deadline;
    while (!ended_) {
        if (pump(until))
            continue;
        outcome_.timed_out = true;
        ::kill(pid_, SIGKILL);
        reap();
    }
    outcome_.out = sources_[0].text;
    outcome_.err = sources_[1].text;
    outcome_.report = sources_[2].text;
    return outcome_;
}

outcome process::terminate(std::chrono::milliseconds deadline)
{
    send_signal(SIGTERM);
    return wait(deadline);
}

// Waits for the next thing to happen and takes it in. False when the deadline came first.
bool process::pump(clock::time_point deadline)
{
    pollfd waits[] = {{sources_[0].pipe.number(), POLLIN, 0},
                      {sources_[1].pipe.number(), POLLIN, 0},
                      {sources_[2].pipe.number(), POLLIN, 0},
                      {end_.number(), POLLIN, 0}};
    int ready = ::poll(waits, 4, milliseconds_until(deadline));
    if (ready == 0)
        return false;
    require(ready > 0 || errno == EINTR, "poll");
    for (size_t i = 0; i < 3; ++i)
        if (waits[i].revents)
            read_available(sources_[i]);
    if (waits[3].revents)
        reap();
    return true;
}

void process::read_available(source &from)
{
    std::array<char, 64 * 1024> bytes;
    while (from.pipe) {
        ssize_t count = ::read(from.pipe.number(), bytes.data(), bytes.size());
        if (count > 0)
            from.text.append(bytes.data(), static_cast<size_t>(count));
        else if (count < 0 && errno == EAGAIN)
            return;
        else if (count == 0 || errno != EINTR)
            from.pipe.reset();
    }
}

void process::reap()
{
    watcher_.join();
    int status = 0;
    while (::waitpid(pid_, &status, 0) < 0 && errno == EINTR)
        continue;
    ended_ = true;
    if (WIFEXITED(status))
        outcome_.exit_status = WEXITSTATUS(status);
    else
        outcome_.signal = WTERMSIG(status);
    // Not until the end of the pipes, which children of the program may still hold open.
    for (source &each : sources_)
        read_available(each);
}

std::string process::everything_written() const
{
    return sources_[0].text + sources_[1].text + sources_[2].text;
}

outcome run(const command &what, std::chrono::milliseconds deadline)
{
    return process(what).wait(deadline);
}

} // namespace quillmere_test
