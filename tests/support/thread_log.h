// Leads the library's diagnostic log into memory, each thread's lines into a text of its own, so
// that calls that run at the same time can be told apart.
#pragma once

#include <cstdio>
#include <string>

namespace quillmere_test {

class thread_log {
public:
    thread_log();
    ~thread_log();
    thread_log(const thread_log &) = delete;
    thread_log &operator=(const thread_log &) = delete;

    // What the calling thread has logged since it last asked.
    static std::string take();

private:
    std::FILE *before_;
    std::FILE *stream_;
};

} // namespace quillmere_test
