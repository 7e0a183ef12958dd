// SIGPIPE, which no peer may bring upon the program.
#pragma once

#include <csignal>

#include <signal.h>

namespace quillmere_test {

inline volatile std::sig_atomic_t pipe_signals = 0;

extern "C" {
inline void count_pipe_signal(int) { pipe_signals = pipe_signals + 1; }
}

// Counts SIGPIPE, of which the library leaves the disposition alone.
class pipe_signal_counter {
public:
    pipe_signal_counter()
    {
        pipe_signals = 0;
        struct sigaction counting = {};
        counting.sa_handler = count_pipe_signal;
        sigaction(SIGPIPE, &counting, &before_);
    }
    ~pipe_signal_counter() { sigaction(SIGPIPE, &before_, nullptr); }
    pipe_signal_counter(const pipe_signal_counter &) = delete;
    pipe_signal_counter &operator=(const pipe_signal_counter &) = delete;

    int count() const { return pipe_signals; }

private:
    struct sigaction before_ = {};
};

} // namespace quillmere_test
