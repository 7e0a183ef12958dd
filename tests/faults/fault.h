// One row of the table of faults: what a server, a proxy or the way there does to an exchange, and
// what an exchange makes of it.
#pragma once

#include <functional>
#include <iosfwd>
#include <optional>
#include <string>
#include <vector>

#include <curl/curl.h>

#include "quillmere.h"
#include "support/scripted_server.h"

namespace quillmere_test {

// What the URL says and what the server speaks, which may be two things.
enum class wire { http, https, https_to_plain_server, http_to_tls_server };

// Where the connection goes.
enum class destination {
    server,
    nobody,
    full_queue,
    unknown_host,
    server_as_proxy,
    nobody_as_proxy
};

// What the library is told of certificates.
enum class trust { test_root, nothing, missing_file, anything };

struct expectation {
    int64_t code = -1;
    std::optional<std::string> body;
    int32_t status = QM_NO_RESPONSE;    // of the operation
    std::optional<std::string> message; // of the operation

    // The codes of libcurl with which an attempt may fail: more than one where it is the machine's
    // pace that decides which end notices first. None: attempts succeed.
    std::vector<CURLcode> failures;

    int32_t succeeds_at = 0; // the first attempt that does; 0: none
    size_t requests = 1;     // that the server sees in an attempt
    size_t connections = 1;  // the same
    size_t elsewhere = 0;    // requests that the server sees to which an attempt is redirected

    expectation seen(size_t requests_per_attempt, size_t connections_per_attempt) const;
    expectation seen_elsewhere(size_t requests_per_attempt) const;
};

// Every attempt fails, in one of these ways.
expectation fails(std::vector<CURLcode> failures);

// The exchange yields this; what the operation makes of it follows.
expectation yields(int64_t code, std::optional<std::string> body, int32_t status,
                   std::optional<std::string> message);

// The same for a reply whose text an operation cannot use; the message tells of the code.
expectation yields_unusable(int64_t code, std::optional<std::string> body, int32_t status);

// A reply with which the operation succeeds, and what makes an exchange yield it.
extern const std::string good_body;
expectation succeeds(int64_t code = 200);

// The first attempts fail before one succeeds.
expectation fails_once(std::vector<CURLcode> failures, expectation then);

struct fault {
    std::string name;
    std::vector<connection_script> scripts; // as scripted_server::next() takes them
    expectation expected;
    std::vector<wire> wires = {wire::http, wire::https};
    destination to = destination::server;
    trust trusts = trust::test_root;
    std::function<certificate()> shown = loopback_certificate; // by a TLS server
    int64_t timeout_seconds = 10;
    bool waits = false;                    // for the time-out, that is
    std::optional<wire> redirects_to = {}; // every request, to another server

    // Each returns the row with something changed, so that a row reads as a sentence.
    fault over(std::vector<wire> others) const;
    fault towards(destination other) const;
    fault trusting(trust other) const;
    fault showing(std::function<certificate()> other) const;
    fault redirecting(wire other) const;

    // Fails by its time-out, which is the shortest that can be set.
    fault until_time_out() const;
};

// Sends what stands here after the request has been read, and then goes on with the last step.
connection_script sending(std::string bytes, std::function<void(connection &)> then);

// Last steps.
void close(connection &client);
void reset(connection &client);
void stall(connection &client);

std::vector<fault> connection_faults();
std::vector<fault> cut_off_replies();
std::vector<fault> malformed_replies();
std::vector<fault> unexpected_replies();
std::vector<fault> redirect_faults();
std::vector<fault> certificate_faults();
std::vector<fault> proxy_faults();

// A row on one of its wires, which is one test.
struct trial {
    fault what;
    wire on;

    std::string name() const; // letters, digits and underscores
};

void PrintTo(const trial &each, std::ostream *out);
std::vector<trial> trials_of(const std::vector<fault> &faults);

} // namespace quillmere_test
