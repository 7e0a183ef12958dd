// Faults that a test asks for: for whom they are meant, how often they fire, and the count of it.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <string_view>
#include <vector>

#include "certificates.h"

namespace emulator {

enum class fault_kind {
    status,      // another answer, and nothing is done
    delay,       // the answer comes later
    cut,         // the answer breaks off
    stall,       // nothing is done, and no answer comes
    lost_reply,  // it is done, and the connection ends without an answer
    reset,       // nothing is done, and the connection is reset
    certificate, // of a new TLS connection
};

struct fault {
    fault_kind kind = fault_kind::status;

    // When it fires. Of the requests that it is for it lets the first ones pass, and of the others
    // it takes each with a probability, until it has fired as often as it may.
    std::string path; // how the paths begin that it is for; empty for all
    std::uint64_t after = 0;
    std::optional<std::uint64_t> count = {};
    double probability = 1;
    std::uint64_t seed = 0;

    // What it does, each for the kind of that name.
    unsigned status = 503;
    std::string content_type = "text/html; charset=utf-8";
    std::optional<std::string> body = {}; // a page that tells the status
    std::chrono::milliseconds delay{0};
    std::uint64_t after_bytes = 0;
    certificate_variant which = certificate_variant::expired;
};

/** A fault that is in force, and what it has met. */
struct placed_fault {
    std::uint64_t id;
    fault rule;
    std::mt19937_64 chance;
    std::uint64_t seen = 0;  // requests or connections that it was for
    std::uint64_t fired = 0; // those of them that it took
};

/** The first fault, in the order in which they were placed, that is for a request and fires, takes
 * it; those behind it do not see it. */
class fault_list {
public:
    static constexpr std::size_t most = 256;

    /** Returns its number, which no other one ever has; nothing when there are too many. */
    std::optional<std::uint64_t> place(fault rule);
    bool remove(std::uint64_t id);
    void clear() { placed_.clear(); }

    const std::vector<placed_fault> &all() const { return placed_; }
    const placed_fault *find(std::uint64_t id) const;

    /** The fault that takes a request for this path, or null. It holds until a fault is removed or
     * placed. */
    const fault *strike_request(std::string_view path);
    /** The same of a new TLS connection. */
    const fault *strike_connection();

private:
    std::vector<placed_fault> placed_;
    std::uint64_t last_id_ = 0;
};

} // namespace emulator
