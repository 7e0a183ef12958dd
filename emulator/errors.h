// What can go wrong with a request: one number, HTTP status and message for each case.
#pragma once

#include <exception>
#include <string>
#include <vector>

namespace emulator {

/** The service's own error numbers, as they stand in the "error" element of a reply. */
enum class error {
    internal = 100,
    unknown_endpoint = 101,
    method_not_allowed = 102,
    malformed_request = 103,
    parameter_missing = 104,
    session_invalid = 105,
    parameter_invalid = 106,
    credentials_wrong = 107,
    application_unknown = 108,
    signature_wrong = 109,
    request_too_large = 110,
    body_type_unsupported = 111,
    folder_unknown = 112,
    file_unknown = 113,
    access_denied = 114,
    name_taken = 115,
    too_deep = 116,
    storage_exceeded = 117,
    content_missing = 118,
    bandwidth_spent = 119,
    into_itself = 120,
    is_root = 121,
    attachment_wrong = 122,
    daily_limit_reached = 123,
    link_unknown = 124,
    range_unsatisfiable = 125,
    edit_impossible = 126,
    revision_outdated = 127,
    content_mismatch = 128,
    content_present = 129,
};

struct error_row {
    error number;
    unsigned http_status;
    const char *message;
};

/** The whole table, in the order of the numbers. */
const std::vector<error_row> &error_table();

const error_row &row_of(error number);

/** Thrown by whatever finds that a request cannot be served; the router makes the reply of it. */
class refusal : public std::exception {
public:
    /** The detail is shown to the client behind the message, so it must not hold a secret. */
    explicit refusal(error number, const std::string &detail = {});

    error number() const { return number_; }
    const char *what() const noexcept override { return message_.c_str(); }

private:
    error number_;
    std::string message_;
};

} // namespace emulator
