// Reads in the library's log what an operation's status leaves out: why a transfer failed, and how
// the body of an answer began that could not be used.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace quillmere::tools {

/** A transfer that failed, in the words of the transport. */
struct transfer_error {
    int code = 0;     ///< of libcurl
    std::string text; ///< the particular reason, or the general one where there is no other
};

class exchange_watch {
public:
    /** Forgets what was seen: the next exchange begins. */
    void begin();

    /** Takes the next piece of the log, before masking. */
    void feed(std::string_view piece);

    const std::optional<transfer_error> &error() const { return error_; }

    /** The beginning of the body that arrived, empty if there was none. */
    std::string_view body_beginning() const;

private:
    void end_line();

    bool in_body_ = false;
    std::string line_;
    std::string body_;
    std::optional<transfer_error> error_;
};

/** Whether a body that begins like this is an HTML page. */
bool looks_like_html(std::string_view body_beginning);

} // namespace quillmere::tools
