// Leads the library's diagnostic log into memory for as long as the object lives.
#pragma once

#include <cstdio>
#include <string>

namespace quillmere_test {

class log_capture {
public:
    log_capture();
    ~log_capture();
    log_capture(const log_capture &) = delete;
    log_capture &operator=(const log_capture &) = delete;

    // What was logged since the start, or since clear(). May be read while other threads log.
    std::string text() const;
    void clear();

private:
    std::string whole_text() const;

    std::FILE *before_;
    char *bytes_ = nullptr;
    size_t length_ = 0;
    std::FILE *stream_;
    size_t start_ = 0;
};

} // namespace quillmere_test
