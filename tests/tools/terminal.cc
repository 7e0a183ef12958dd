#include "terminal.h"

#include <array>
#include <csignal>
#include <cstdlib>
#include <stdexcept>
#include <vector>

#include <poll.h>
#include <pty.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

#include "support/failure.h"

namespace quillmere_test {

namespace {

[[noreturn]] void become(const command &what)
{
    ::signal(SIGINT, SIG_DFL); // whatever started the tests may ignore it
    for (const auto &[name, value] : what.environment) {
        if (value)
            ::setenv(name.c_str(), value->c_str(), 1);
        else
            ::unsetenv(name.c_str());
    }
    std::vector<char *> words = {const_cast<char *>(what.program.c_str())};
    for (const std::string &argument : what.arguments)
        words.push_back(const_cast<char *>(argument.c_str()));
    words.push_back(nullptr);
    ::execv(what.program.c_str(), words.data());
    ::_exit(127);
}

} // namespace

terminal_program::terminal_program(const command &what)
{
    pid_ = ::forkpty(&terminal_, nullptr, nullptr, nullptr);
    require(pid_ >= 0, "forkpty");
    if (pid_ == 0)
        become(what);
}

terminal_program::~terminal_program()
{
    if (!ended_) {
        ::kill(pid_, SIGKILL);
        ::waitpid(pid_, nullptr, 0);
    }
    ::close(terminal_);
}

void terminal_program::wait_for(std::string_view text)
{
    while (shown_.find(text) == std::string::npos)
        if (!read_more())
            throw std::runtime_error("the program ended and had shown: " + shown_);
}

void terminal_program::type(std::string_view text) const
{
    require(::write(terminal_, text.data(), text.size()) == static_cast<ssize_t>(text.size()),
            "write");
}

bool terminal_program::shows_typing() const
{
    termios settings = {};
    require(::tcgetattr(terminal_, &settings) == 0, "tcgetattr");
    return (settings.c_lflag & static_cast<tcflag_t>(ECHO)) != 0;
}

void terminal_program::send_signal(int number) const { require(::kill(pid_, number) == 0, "kill"); }

int terminal_program::wait()
{
    while (read_more())
        continue;
    int status = 0;
    require(::waitpid(pid_, &status, 0) == pid_, "waitpid");
    ended_ = true;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

// The terminal gives EIO once the program, its last user, has closed it.
bool terminal_program::read_more()
{
    pollfd readable = {terminal_, POLLIN, 0};
    if (::poll(&readable, 1, static_cast<int>(std::chrono::milliseconds(patience).count())) == 0)
        throw std::runtime_error("nothing came for too long; shown was: " + shown_);
    std::array<char, 4096> piece;
    const ssize_t count = ::read(terminal_, piece.data(), piece.size());
    if (count > 0)
        shown_.append(piece.data(), static_cast<size_t>(count));
    return count > 0;
}

} // namespace quillmere_test
