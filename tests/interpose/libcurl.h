// A libcurl that was built otherwise, or that refuses, when a test says so.
#pragma once

#include <string>
#include <vector>

#include <curl/curl.h>

namespace quillmere_test {

// An option that was set on a share handle, with its value if that is a kind of data.
struct share_option {
    CURLSHoption option;
    int kind;
};

// While it lives, libcurl does what the fields say. One at a time.
class pretended_libcurl {
public:
    pretended_libcurl();
    ~pretended_libcurl();
    pretended_libcurl(const pretended_libcurl &) = delete;
    pretended_libcurl &operator=(const pretended_libcurl &) = delete;

    const char *ssl_version = nullptr; // the TLS library's version text, if not the true one
    bool makes_share_handles = true;
    CURLSHoption refused_option = CURLSHOPT_NONE;
    CURLSHcode refusal = CURLSHE_BAD_OPTION;

    std::vector<std::string> calls; // of start, version, share handle and stop, in their order
    long global_flags = -1;
    std::vector<CURLSH *> handles;  // the share handles that were made
    std::vector<CURLSH *> released; // and those that were cleaned up
    std::vector<share_option> options;
    CURLversion asked_age = CURLVERSION_FIRST;
};

} // namespace quillmere_test
