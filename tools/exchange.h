// One exchange with the service, as the command line sees it: what the operation returned, what the
// log told besides, and what that means for the user.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "ca_bundle.h"
#include "exchange_watch.h"
#include "failure.h"

namespace quillmere::tools {

struct exchange {
    std::int32_t status = 0; ///< what the operation returned
    std::string message;     ///< its error message, or empty
    std::optional<transfer_error> error;
    bool html = false; ///< an HTML page arrived instead of a reply
};

/** What is worth telling about the service when an exchange failed. */
struct exchange_setting {
    std::string service;
    std::optional<ca_bundle> ca;
    std::optional<std::string> emulator_root; ///< what an emulator's certificate needs
};

/** The HTTP status that the library's message names, or nothing. */
std::optional<int> http_status_of(const std::string &message);

/**
 * Whether the same request may well succeed a little later: no answer arrived, or HTTP 429 or 5xx
 * without a reply. A certificate that is not trusted will not be trusted later either.
 */
bool worth_repeating(const exchange &ended);

/**
 * What to tell the user of an exchange that failed.
 *
 * @param action what was attempted ("signing in")
 */
failure failure_of(const exchange &ended, const std::string &action,
                   const exchange_setting &setting);

} // namespace quillmere::tools
