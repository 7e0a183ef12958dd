// Stands between the library and libcurl's easy interface: shows a test every option that is set,
// and fails when a test says so.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <ostream>
#include <string>
#include <vector>

#include <curl/curl.h>

namespace quillmere_test {

constexpr const char *any_url = "http://service.example/a/path"; // where nothing is to answer

// A time-out as the library is given it, and as libcurl is.
struct timeout_case {
    int64_t given;
    long used;
};

inline void PrintTo(const timeout_case &each, std::ostream *out) { *out << each.given; }

// Numbers stand in number; texts and blobs, copied, in text; other pointers in pointer.
struct easy_option {
    CURLoption option;
    long number;
    std::string text;
    const void *pointer;
};

// What hands over certificates in memory, in its order.
extern const std::vector<CURLoption> memory_options;

// While it lives, calls to libcurl go by its fields. One at a time, on one thread.
class easy_calls {
public:
    easy_calls();
    ~easy_calls();
    easy_calls(const easy_calls &) = delete;
    easy_calls &operator=(const easy_calls &) = delete;

    size_t failing_inits = 0;                            // how many handles cannot be made at first
    CURLoption refused = CURLOPT_LASTENTRY;              // which option is refused
    CURLcode refusal = CURLE_BAD_FUNCTION_ARGUMENT;      // and how
    std::function<CURLcode(size_t performance)> perform; // instead of a transfer, counted from 1
    CURLINFO refused_info = CURLINFO_NONE;               // what is not told of a handle
    std::map<CURLINFO, long> told;                       // what is told instead of the truth
    long other_port = 0; // where a connection goes whose port is set; 0: to that port

    size_t inits = 0;
    std::vector<CURL *> handles;
    size_t performances = 0;
    size_t cleanups = 0;
    std::vector<easy_option> options;            // in the order of the calls
    char *error_buffer = nullptr;                // the last that was set
    std::vector<std::string> error_buffer_texts; // what each held when it was set

    // The options alone, without those that a test says are beside its point.
    std::vector<CURLoption> names(const std::vector<CURLoption> &without = {}) const;
    bool has(CURLoption option) const;
    const easy_option &last(CURLoption option) const; // fails if it was never set
};

} // namespace quillmere_test
