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

// Has libcurl remember no TLS session. A handle makes a single transfer here, so that a session
// could serve nobody but a redirect, and when memory runs out while one is stored, libcurl (7.88 at
// least) frees its host name twice.
void keep_no_tls_sessions(CURL *handle);

// This and verify_peer() are false when libcurl had no memory to keep what they set. The transfer
// must not take place then: it would go past the proxy, or trust the certificates of libcurl's own
// choice.
[[nodiscard]] bool use_proxy(CURL *handle);

// Verifies the peer against the configured certificates, or, without any, not at all. The host name
// is checked in either case. The certificates are those of trusted_certificates(), which must
// outlive the transfer.
[[nodiscard]] bool verify_peer(CURL *handle, X509_STORE *certificates);

// The configured certificates, for a transfer that begins with this URL; null if libcurl has to
// read the file itself, or needs none. Connections are kept as long as they stay the same.
certificate_store trusted_certificates(const char *url);

// libcurl's text for the last failure of one call. It starts empty and then keeps what libcurl
// writes.
struct error_text {
    char text[CURL_ERROR_SIZE] = "";
};

void log_failure(CURLcode code, const error_text &error);

} // namespace quillmere
