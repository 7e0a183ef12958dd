// One download: the bytes behind a link, from where a partial file ends.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include <curl/curl.h>

#include "partial_file.h"
#include "progress.h"

namespace quillmere::tools {

enum class link_security { tls_alone, plain_too };

/** Fetches links, with a connection that is kept from one to the next. */
class downloader {
public:
    /** Trusts the authorities that the library was started with. */
    downloader(link_security security, int timeout_seconds);

    /**
     * Fetches what the file lacks. Results are those of the library's operations, so that it is
     * asked for through the service as they are, and goes on when it is repeated.
     *
     * @param error_message receives the message of a failure or NULL; freed with api_free()
     *
     * Throws failure when the file cannot be written.
     */
    std::int32_t fetch(const std::string &url, partial_file &into, progress &shown,
                       char **error_message);

private:
    struct releaser {
        void operator()(CURL *handle) const { curl_easy_cleanup(handle); }
    };

    void prepare(const std::string &url, std::uint64_t from);

    std::unique_ptr<CURL, releaser> handle_;
    link_security security_;
    int timeout_seconds_;
};

} // namespace quillmere::tools
