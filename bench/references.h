// What a call cannot do without: the exchange as an application would make it with libcurl alone,
// and one pass of expat over the reply.
#pragma once

#include <curl/curl.h>

#include <memory>
#include <string>

namespace quillmere_bench {

// With empty handlers.
void parse_once(const char *reply, size_t length);

struct handle_cleaner {
    void operator()(CURL *handle) const { curl_easy_cleanup(handle); }
};
using raw_handle = std::unique_ptr<CURL, handle_cleaner>;

// The options that the library sets, too. The body is discarded.
void set_options(CURL *handle, const std::string &url, const std::string &ca_path);
raw_handle new_raw_handle(const std::string &url, const std::string &ca_path);

// Ends the program when the transfer fails.
void perform(CURL *handle);

void raw_exchange(const std::string &url, const std::string &ca_path); // on a handle of its own

// The same without a certificate to read or to verify against.
void unverified_exchange(const std::string &url);

} // namespace quillmere_bench
