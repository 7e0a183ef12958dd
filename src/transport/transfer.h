// What every libcurl transfer of the library has in common, taken from the process-wide
// configuration at each call.
#pragma once

#include "owned.h"

namespace quillmere {

// The DNS cache that all transfers share, when there is one.
void share_dns_cache(CURL *handle);

// Keeps redirects within bounds: 30 of them, to HTTP and HTTPS alone, and never from HTTPS back to
// HTTP, where the session token in the query could be read. A first request's scheme is the
// caller's choice.
void restrain_redirects(CURL *handle);

void use_proxy(CURL *handle);

// Verifies the peer against the configured certificates, or, without any, not at all. The host name
// is checked in either case.
void verify_peer(CURL *handle);

// libcurl's text for the last failure of one call. It starts empty and then keeps what libcurl
// writes.
struct error_text {
    char text[CURL_ERROR_SIZE] = "";
};

void log_failure(CURLcode code, const error_text &error);

} // namespace quillmere
