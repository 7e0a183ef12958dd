// Servers for the tests of the upload connection, and what it prints.
#pragma once

#include "support/library_fixture.h"
#include "support/stdout_capture.h"
#include "transport/upload_connection.h"

namespace quillmere_test {

constexpr uint16_t tls_port = 443;
constexpr const char *retried = "Error: wait_on_socket failed.\n";

// A test's own server, on port 443 for TLS, at an address that no other test has.
class upload_test : public library_test {
protected:
    static server_options tls_options(const certificate &leaf)
    {
        return on_port(tls_port, on_address(address_of_this_process(), tls_with(leaf)));
    }

    static certificate certificate_of_this_process()
    {
        return test_root().issue({{address_of_this_process()}});
    }

    // False if this system does not let us have the port.
    bool start_tls(const certificate &leaf)
    {
        try {
            peer = std::make_unique<scripted_server>(tls_options(leaf));
            return true;
        } catch (const std::system_error &refusal) {
            if (refusal.code() != std::errc::permission_denied)
                throw;
            return false;
        }
    }

    // What was printed, but for the retries: a TLS session's own messages make the socket ready
    // too.
    std::string printed() const
    {
        std::string text = output.text();
        for (size_t at = 0; (at = text.find(retried, at)) != std::string::npos;)
            text.erase(at, std::string(retried).size());
        return text;
    }

    std::unique_ptr<scripted_server> peer;
    stdout_capture output;
};

constexpr const char *not_permitted = "port 443 may not be bound here";

} // namespace quillmere_test
