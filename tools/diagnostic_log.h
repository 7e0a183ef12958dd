// Where the library's log goes: through the watch and the masking filter to standard error, to a
// file, to both or nowhere. Never to standard output, which carries results alone.
#pragma once

#include <cstdio>
#include <string>
#include <string_view>

#include "descriptor.h"
#include "exchange_watch.h"
#include "masking_filter.h"

namespace quillmere::tools {

class diagnostic_log {
public:
    /**
     * Opens the log and makes it the process's stdout stream too, because parts of the library
     * print there.
     *
     * @param verbose whether standard error gets the log
     * @param file    receives the log at its end, made with mode 0600; or empty for none
     */
    diagnostic_log(bool verbose, const std::string &file);
    diagnostic_log(const diagnostic_log &) = delete;
    diagnostic_log &operator=(const diagnostic_log &) = delete;
    ~diagnostic_log();

    std::FILE *stream() const { return stream_; }
    exchange_watch &watch() { return watch_; }

    /** Takes a piece of the log; what cannot be written is lost. */
    void take(std::string_view piece);

private:
    bool verbose_;
    descriptor file_;
    exchange_watch watch_;
    masking_filter filter_;
    std::FILE *stream_ = nullptr;
    std::FILE *former_stdout_ = nullptr;
};

} // namespace quillmere::tools
