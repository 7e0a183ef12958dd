// Calls of the exchange in the form in which the tests want them, and its log lines.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <string_view>

#include <curl/curl.h>

#include "quillmere.h"

namespace quillmere_test {

constexpr const char *path = "/a/path/of/some/length"; // to ask for where it does not matter
constexpr const char *success = "<response><result>Success</result></response>";

// What an operation says where no answer came.
constexpr const char *no_code = "Response error: no server HTTP response code received";

struct exchange {
    int64_t code;
    std::optional<std::string> body; // without a value where the response text was NULL
    uint64_t length;
};

struct posted {
    const void *body;
    uint64_t length;
};

// The out-parameters hold rubbish before the call, so that a test sees whether they are reset.
exchange fetch(const std::string &url, posted post = {nullptr, 0}, int64_t timeout_seconds = 0);

inline posted post_of(std::string_view body) { return {body.data(), body.size()}; }

// A regular expression that matches this text alone.
std::string literally(const std::string &text);

// Matches the log line of a transfer that failed with this code, whatever libcurl says about it, as
// long as it says something.
std::string failure_line(CURLcode code, const char *said = "[^\n]+");

// The same for a code that depends on which end of the connection notices first.
extern const char *const any_failure_line;

std::string repeated(const std::string &text, size_t times);

} // namespace quillmere_test
