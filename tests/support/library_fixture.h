// A started library that talks to servers of the test's own, and leaves nothing changed behind.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "quillmere.h"
#include "support/certificates.h"
#include "support/globals_guard.h"
#include "support/hook_recorder.h"
#include "support/log_capture.h"
#include "support/scripted_server.h"

namespace quillmere_test {

// Without the variables through which libcurl would send the tests' requests to a proxy.
class proxyless_environment {
public:
    proxyless_environment();

private:
    environment_guard guard_;
};

class running_library {
public:
    // ca_path may be NULL, to run without a certificate authority.
    explicit running_library(const char *ca_path) { api_global_init(ca_path); }
    ~running_library() { api_global_cleanup(); }
    running_library(const running_library &) = delete;
    running_library &operator=(const running_library &) = delete;
};

// One attempt a request and a default time-out of ten seconds. urls[0] and urls[2] lead to
// plain_server, urls[1] and urls[3] to server, which has a good certificate. log is empty at the
// start of a test.
class library_test : public testing::Test {
protected:
    explicit library_test(const char *ca_path = test_root_path().c_str());

    // Another server for operations and TLS uploads, which must outlive the requests to it.
    void point_at(const scripted_server &other) { point_at(other.base_url()); }
    void point_at(const std::string &tls_base);

    // The members are in the order in which the library's rules want them made and, backwards,
    // destroyed: it is stopped after the servers' threads and before the variables are put back.
    proxyless_environment environment;
    globals_guard globals;
    log_capture log;
    running_library library;
    scripted_server plain_server;
    scripted_server server{tls_with(loopback_certificate())};

private:
    std::string base_[4];
};

} // namespace quillmere_test
