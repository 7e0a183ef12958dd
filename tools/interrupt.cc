#include "interrupt.h"

#include <unistd.h>

#include "failure.h"

namespace quillmere::tools {

namespace {

// What the signal handler needs. Written before the flag is set, read by the handler after it.
termios shown_settings;
int hidden_terminal = -1;
volatile std::sig_atomic_t echo_is_hidden = 0;

volatile std::sig_atomic_t line_is_open = 0;

void end_open_line()
{
    if (line_is_open == 0)
        return;
    line_is_open = 0;
    // What cannot be written to a terminal that is gone is not missed either.
    static_cast<void>(::write(STDERR_FILENO, "\n", 1) == 1);
}

void restore_echo()
{
    if (echo_is_hidden == 0)
        return;
    echo_is_hidden = 0;
    ::tcsetattr(hidden_terminal, TCSAFLUSH, &shown_settings);
}

extern "C" {
// An operation of the library blocks for up to its time-out and cannot be asked to stop, so the
// process ends from here. Only functions that are safe in a handler may be called.
static void stop_for_user(int)
{
    restore_echo();
    end_open_line();
    ::_exit(static_cast<int>(exit_code::interrupted));
}

// SA_RESETHAND has restored the default action, which the second signal meets.
static void stop_for_system(int signal_number)
{
    restore_echo();
    end_open_line();
    ::raise(signal_number);
}
}

void install(int signal_number, void (*handler)(int), int flags)
{
    struct sigaction former = {};
    ::sigaction(signal_number, nullptr, &former);
    // Whoever started the program with a signal ignored, as nohup does, wants it ignored.
    if (former.sa_handler == SIG_IGN)
        return;
    struct sigaction action = {};
    action.sa_handler = handler;
    action.sa_flags = flags;
    ::sigemptyset(&action.sa_mask);
    ::sigaction(signal_number, &action, nullptr);
}

} // namespace

void handle_interrupts()
{
    install(SIGINT, stop_for_user, 0);
    install(SIGTERM, stop_for_system, static_cast<int>(SA_RESETHAND));
    install(SIGHUP, stop_for_system, static_cast<int>(SA_RESETHAND));
    install(SIGPIPE, SIG_IGN, 0);
}

void mark_open_line(bool open) { line_is_open = open ? 1 : 0; }

echo_pause::echo_pause(int terminal, bool wanted)
{
    if (!wanted || ::tcgetattr(terminal, &shown_settings) != 0)
        return;
    hidden_terminal = terminal;
    termios settings = shown_settings;
    settings.c_lflag &= ~static_cast<tcflag_t>(ECHO);
    echo_is_hidden = 1;
    active_ = true;
    ::tcsetattr(terminal, TCSAFLUSH, &settings);
}

echo_pause::~echo_pause()
{
    if (active_)
        restore_echo();
}

interrupts_held::interrupts_held()
{
    sigset_t all;
    ::sigfillset(&all);
    ::sigprocmask(SIG_BLOCK, &all, &former_);
}

interrupts_held::~interrupts_held() { ::sigprocmask(SIG_SETMASK, &former_, nullptr); }

} // namespace quillmere::tools
