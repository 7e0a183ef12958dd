// Runs programs for a test: with their arguments, their environment, their input, and an end.
#pragma once

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <sys/types.h>

#include "support/descriptor.h"
#include "support/failure.h"

namespace quillmere_test {

struct command {
    std::string program; // sought in PATH if it has no slash
    std::vector<std::string> arguments;
    // Changes to the environment of the test; no value takes the variable away.
    std::map<std::string, std::optional<std::string>> environment;
    std::string input;  // what the program finds on its standard input
    std::string folder; // the working directory, or empty for the test's own
};

struct outcome {
    std::optional<int> exit_status; // of a program that ended by itself
    std::optional<int> signal;      // of one that was killed
    bool timed_out = false;         // killed by us at the deadline
    std::string out;
    std::string err;
    std::string report; // what was written to descriptor 3
};

// Where a program writes: standard output, standard error, or a pipe at descriptor 3, which it may
// be told of as "/dev/fd/3".
enum class channel { out, err, report };

// A running program. Its end is the end of the object at the latest.
class process {
public:
    explicit process(const command &what);
    ~process();
    process(const process &) = delete;
    process &operator=(const process &) = delete;

    pid_t pid() const { return pid_; }
    void send_signal(int number) const;

    // The first whole line on a channel that contains the text. Fails, with what was written, when
    // the program ends or the deadline passes before there is one.
    std::string wait_for_line(channel from, std::string_view containing = "",
                              std::chrono::milliseconds deadline = patience);

    // Waits for the end; kills the program at the deadline.
    outcome wait(std::chrono::milliseconds deadline = patience);

    // Asks for an end with SIGTERM and waits for it.
    outcome terminate(std::chrono::milliseconds deadline = patience);

private:
    struct source {
        descriptor pipe;
        std::string text;
    };

    void start(const command &what, const descriptor (&writers)[3]);
    void watch();
    bool pump(std::chrono::steady_clock::time_point deadline);
    void read_available(source &from);
    void reap();
    std::string everything_written() const;

    pid_t pid_ = -1;
    descriptor end_; // readable when the program has ended
    std::thread watcher_;
    source sources_[3];
    outcome outcome_;
    bool ended_ = false;
};

outcome run(const command &what, std::chrono::milliseconds deadline = patience);

} // namespace quillmere_test
