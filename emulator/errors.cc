#include "errors.h"

#include <stdexcept>

namespace emulator {

const std::vector<error_row> &error_table()
{
    // Refused credentials are 403, not 401: a 401 would promise a challenge that is never sent.
    static const std::vector<error_row> table = {
        {error::internal, 500, "Internal server error"},
        {error::unknown_endpoint, 404, "Unknown API endpoint"},
        {error::method_not_allowed, 405, "Method not allowed"},
        {error::malformed_request, 400, "Malformed request"},
        {error::parameter_missing, 400, "Required parameter missing"},
        {error::session_invalid, 403, "The session token is invalid or has expired"},
        {error::parameter_invalid, 400, "Invalid parameter"},
        {error::credentials_wrong, 403, "The credentials you entered are invalid"},
        {error::application_unknown, 403, "The application id is unknown"},
        {error::signature_wrong, 403, "The signature is invalid"},
        {error::request_too_large, 413, "The request is too large"},
        {error::body_type_unsupported, 415, "The type of the request body is not supported"},
        {error::folder_unknown, 404, "Unknown folder"},
        {error::file_unknown, 404, "Unknown file"},
        {error::access_denied, 403, "Access denied"},
        {error::name_taken, 409, "The name is taken in that folder"},
        {error::too_deep, 400, "The folders would be nested too deep"},
        {error::storage_exceeded, 403, "The storage limit of the account is exceeded"},
        {error::content_missing, 404, "The file has no content"},
        {error::bandwidth_spent, 403, "The bandwidth of the account is spent"},
        {error::into_itself, 400, "A folder cannot be put into itself"},
        {error::is_root, 400, "This cannot be done with the root folder"},
        {error::attachment_wrong, 409, "The folder is attached already, or is not"},
        {error::daily_limit_reached, 403, "The limit of the day is reached"},
        {error::link_unknown, 404, "Unknown link"},
        {error::range_unsatisfiable, 416, "The file has no such range"},
        {error::edit_impossible, 403, "A file of this type cannot be edited"},
        {error::revision_outdated, 409, "The file has changed since that revision"},
        {error::content_mismatch, 400, "The bytes are not those that were announced"},
        {error::content_present, 409, "The file has content already"},
    };
    return table;
}

const error_row &row_of(error number)
{
    for (const error_row &row : error_table())
        if (row.number == number)
            return row;
    throw std::logic_error("an error number without a row");
}

refusal::refusal(error number, const std::string &detail)
    : number_(number), message_(row_of(number).message)
{
    if (!detail.empty())
        message_ += ": " + detail;
}

} // namespace emulator
