// A program at a terminal of its own: what it shows, what is typed, whether typing is shown.
#pragma once

#include <string>
#include <string_view>

#include "support/process.h"

namespace quillmere_test {

class terminal_program {
public:
    explicit terminal_program(const command &what);
    ~terminal_program();
    terminal_program(const terminal_program &) = delete;
    terminal_program &operator=(const terminal_program &) = delete;

    /** Waits until the text has been shown; throws when the program ends before. */
    void wait_for(std::string_view text);

    void type(std::string_view text) const;

    bool shows_typing() const;

    void send_signal(int number) const;

    /** Waits for the end and gives the exit status, or minus the number of a signal. */
    int wait();

    const std::string &shown() const { return shown_; }

private:
    bool read_more();

    int terminal_ = -1;
    pid_t pid_ = -1;
    bool ended_ = false;
    std::string shown_;
};

} // namespace quillmere_test
