// Being told to stop: the terminal gets its echo back, files are left whole, and the exit code says
// that it was the user.
#pragma once

#include <csignal>

#include <termios.h>

namespace quillmere::tools {

/**
 * From now on SIGINT ends the process at once with exit code 130, and SIGTERM and SIGHUP as they
 * always do, but with the terminal put right first. SIGPIPE is ignored: a peer that hangs up is an
 * error of that connection. Call it once, at the start.
 */
void handle_interrupts();

/** Whether the terminal's cursor stands behind a line that is not ended. A signal that ends the
 * process ends the line first, so that what comes next does not stand in it. */
void mark_open_line(bool open);

/** Keeps what is typed at a terminal from being shown, until it is destroyed or a signal comes. */
class echo_pause {
public:
    /** Does nothing when not wanted, or when the descriptor is no terminal. */
    echo_pause(int terminal, bool wanted);
    echo_pause(const echo_pause &) = delete;
    echo_pause &operator=(const echo_pause &) = delete;
    ~echo_pause();

private:
    bool active_ = false;
};

/** Makes signals wait for the few system calls that must happen together. */
class interrupts_held {
public:
    interrupts_held();
    interrupts_held(const interrupts_held &) = delete;
    interrupts_held &operator=(const interrupts_held &) = delete;
    ~interrupts_held();

private:
    sigset_t former_;
};

} // namespace quillmere::tools
