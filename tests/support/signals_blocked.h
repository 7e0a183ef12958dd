// Threads of the test support leave every signal to the test: a test that counts signals gets them
// all, and a write to a dead peer raises no SIGPIPE. A thread inherits what its maker blocks.
#pragma once

#include <signal.h>

namespace quillmere_test {

class signals_blocked {
public:
    signals_blocked()
    {
        sigset_t all;
        sigfillset(&all);
        pthread_sigmask(SIG_SETMASK, &all, &before_);
    }
    ~signals_blocked() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
    signals_blocked(const signals_blocked &) = delete;
    signals_blocked &operator=(const signals_blocked &) = delete;

private:
    sigset_t before_;
};

} // namespace quillmere_test
