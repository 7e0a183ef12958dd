// The library at work: started with the settings, asked one operation at a time, stopped at the
// end.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "diagnostic_log.h"
#include "exchange.h"
#include "retry.h"
#include "settings.h"

namespace quillmere::tools {

/** An operation with its arguments bound, but for the error message's place. */
using operation = std::function<std::int32_t(char **error_message)>;

class service {
public:
    /** Starts the library; there must be only one at a time. All three outlive it. */
    service(const settings &chosen, diagnostic_log &log, const retry_world &world);
    service(const service &) = delete;
    service &operator=(const service &) = delete;
    ~service();

    /** Makes a request that changes nothing, repeating it after failures that may pass. */
    void read(const std::string &action, const operation &asked);

    /** Makes a request that must not be made twice unasked. */
    void once(const std::string &action, const operation &asked);

    const std::string &base() const { return chosen_.addresses.secure; }

private:
    exchange attempt(const operation &asked);
    void require_success(const exchange &ended, const std::string &action) const;

    const settings &chosen_;
    diagnostic_log &log_;
    const retry_world &world_;
    const char *former_urls_[4];
};

} // namespace quillmere::tools
