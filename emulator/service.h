// What every request is served with.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "form.h"

namespace emulator {

class database;

/** The state behind the endpoints. The clock is a function so that tests can turn it. */
struct service {
    database &store;
    std::function<std::int64_t()> now; // seconds since 1970
    std::int64_t session_lifetime;     // seconds
};

/** A request as it arrived, its body whole. */
struct request {
    std::string method;
    std::string target;
    std::string content_type;
    std::string body;
};

/** What is sent back. */
struct reply {
    unsigned http_status;
    std::string body;
};

/** One request on its way to an endpoint. */
struct call {
    service &state;
    const parameters &given;
    std::int64_t account; // of the session, for endpoints that need one

    /** A parameter's text; throws a refusal when it is missing or empty. */
    const std::string &required(const char *name) const;
    /** A parameter's text, empty when it is missing. */
    const std::string &optional(const char *name) const;
};

} // namespace emulator
