// What every request is served with.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "files.h"
#include "form.h"

namespace emulator {

class content_store;
class database;

/** The state behind the endpoints. The clock is a function so that tests can turn it. */
struct service {
    database &store;
    content_store &content;
    std::function<std::int64_t()> now; // seconds since 1970
    std::int64_t session_lifetime;     // seconds
};

/** A request as it arrived, its body whole, or handed to a receiver. */
struct request {
    std::string method;
    std::string target;
    std::string content_type;
    std::string body;
    std::string origin = {}; // "https://localhost:4711", as the client addressed the server
    std::string range = {};  // the header fields of these names
    std::string if_range = {};
    std::string content_disposition = {};
    std::string content_digest = {};
    std::string repr_digest = {};
    std::string web_page = {}; // "Origin", which browsers add: whose page asks
    std::optional<std::uint64_t> content_length = {}; // unknown of a body in chunks
};

/** Bytes of a file that are sent as they are. */
struct file_part {
    std::shared_ptr<descriptor> file;
    std::uint64_t offset = 0;
    std::uint64_t length = 0;
};

struct header_field {
    const char *name;
    std::string value;
};

/** What becomes of a reply. All but the first is for tests of clients. */
enum class delivery_kind {
    whole,
    cut,      // the connection ends behind some bytes of it
    withheld, // it never comes, and the connection stays
    reset,    // the connection is torn down instead
};

struct delivery {
    delivery_kind kind = delivery_kind::whole;
    std::uint64_t cut_after = 0; // bytes, those of the header included
    std::chrono::milliseconds delay{0};
};

/** What is sent back. */
struct reply {
    unsigned http_status;
    std::string body;
    std::optional<file_part> file = {};    // in place of the body
    std::vector<header_field> fields = {}; // beside the usual ones, or in place of them
    delivery sending = {};
};

/** Takes the body of one request while it arrives. Nothing is thrown: what goes wrong is answered.
 */
class body_receiver {
public:
    virtual ~body_receiver() = default;
    virtual void take(std::string_view piece) = 0;
    /** Whether the answer is certain, so that the rest of the body is of no use. */
    virtual bool is_refused() const = 0;
    /** What is sent back, once the body is whole or was refused. */
    virtual reply answer() = 0;
};

/** One request on its way to an endpoint. */
struct call {
    service &state;
    const parameters &given;
    std::int64_t account;      // of the session; 0 where none is needed and none was given
    const std::string &origin; // of the request

    /** A parameter's text; throws a refusal when it is missing or empty. */
    const std::string &required(const char *name) const;
    /** A parameter's text, empty when it is missing. */
    const std::string &optional(const char *name) const;
    /** Whether it is given, be it empty. */
    bool has(const char *name) const { return given.find(name) != given.end(); }
};

} // namespace emulator
