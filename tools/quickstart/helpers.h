// Programs that are run for a while, and signals that may come meanwhile: whoever started the one
// has to end it before the other ends us.
#pragma once

#include <csignal>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

#include "../descriptor.h"

namespace quillmere::tools {

/** The program was asked to end, and is to do so when everything is put away. */
struct asked_to_end {
    int signal_number;
};

/** Makes the signals that ask for an end something to be waited for, instead of an end at once. */
class awaited_signals {
public:
    awaited_signals();
    awaited_signals(const awaited_signals &) = delete;
    awaited_signals &operator=(const awaited_signals &) = delete;
    ~awaited_signals();

    /** What the signals were before, which is what other programs are to find. */
    const sigset_t &former() const { return former_; }

    /** Waits until the descriptor can be read, or ended; throws asked_to_end. */
    void wait_for(int readable) const;

private:
    sigset_t former_;
    descriptor signals_;
};

/** How a helper is started. */
struct helper_command {
    std::string program;
    std::vector<std::string> arguments;
    std::map<std::string, std::optional<std::string>> environment; ///< changes; nothing: unset
    std::string output;       ///< file that gets its standard output
    std::string messages;     ///< file that gets its standard error, or empty: it is our own
    int kept_descriptor = -1; ///< becomes its descriptor 3
};

/** A program that runs. It is ended by the end of the object at the latest. */
class helper {
public:
    helper(const helper_command &what, const awaited_signals &signals);
    helper(const helper &) = delete;
    helper &operator=(const helper &) = delete;
    ~helper();

    /** Waits for its end, and gives the exit status, or 128 and the number of a signal. Throws
     * asked_to_end. */
    int wait();

    /** Asks it to end, and waits for that. */
    void stop();

private:
    void collect();

    const awaited_signals &signals_;
    pid_t pid_ = -1;
    int status_ = 0;
    descriptor alive_; // ends when the program does
};

} // namespace quillmere::tools
