#include "transport/http_exchange.h"

#include <cstring>
#include <utility>

#include "owned.h"
#include "runtime/kept_handles.h"
#include "runtime/lifecycle.h"
#include "transport/response_body.h"
#include "transport/transfer.h"

namespace quillmere {

const char *critical_error_text = "SSL: SSL_set_session failed: error:140C30F0:SSL "
                                  "routines:SSL_set_session:unable to find ssl method";

namespace {

// Fixed, whatever the configured base addresses are.
constexpr size_t shortest_url = 27;

struct http_request {
    const char *url;
    const void *body;
    uint64_t body_length;
    int64_t timeout_seconds;

    bool is_post() const { return body && body_length != 0; }
};

bool address(CURL *handle, const http_request &request)
{
    return curl_easy_setopt(handle, CURLOPT_URL, request.url) == CURLE_OK &&
           curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L) == CURLE_OK &&
           curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L) == CURLE_OK;
}

void limit_time(CURL *handle, const http_request &request)
{
    int64_t seconds = request.timeout_seconds;
    if (seconds < 1)
        seconds = ca_cert_pem_path.default_timeout;
    curl_easy_setopt(handle, CURLOPT_TIMEOUT, static_cast<long>(seconds));
}

void send_body(CURL *handle, const http_request &request)
{
    if (!request.is_post())
        return;
    curl_easy_setopt(handle, CURLOPT_POST, 1L);
    curl_easy_setopt(handle, CURLOPT_POSTFIELDSIZE, static_cast<long>(request.body_length));
    curl_easy_setopt(handle, CURLOPT_POSTFIELDS, request.body);
}

// Sets everything up for one attempt; false if libcurl refuses what the attempt cannot do without.
bool prepare(CURL *handle, const http_request &request, X509_STORE *certificates, error_text &error,
             response_body &body)
{
    share_dns_cache(handle);
    curl_easy_setopt(handle, CURLOPT_ERRORBUFFER, error.text);
    if (!address(handle, request))
        return false;
    restrain_redirects(handle);
    keep_no_tls_sessions(handle);
    limit_time(handle, request);
    curl_easy_setopt(handle, CURLOPT_NOPROGRESS, 1L);
    if (!use_proxy(handle) || !verify_peer(handle, certificates))
        return false;
    body.receive_with(handle);
    if (ssl_disabled) {
        curl_easy_setopt(handle, CURLOPT_SSL_VERIFYPEER, 0L);
        curl_easy_setopt(handle, CURLOPT_SSL_VERIFYHOST, 0L);
    }
    send_body(handle, request);
    return true;
}

void report_failure(CURLcode code, const error_text &error)
{
    log_failure(code, error);
    if (std::strcmp(error.text, critical_error_text) != 0)
        return;
    qm_printf("Detected critical error!\n");
    if (event_handler && event_handler->function)
        event_handler->function(0, event_handler->argument);
}

// Whether a kept connection had ended before the request was sent whole, so that the request cannot
// have been carried out. When it ends later, but before a byte of an answer, libcurl itself begins
// anew; what fails otherwise fails on new connections as well.
bool was_stale(CURL *handle, CURLcode code)
{
    long new_connections = 0;
    long redirects = 0;
    long header_bytes = 0;
    curl_easy_getinfo(handle, CURLINFO_NUM_CONNECTS, &new_connections);
    curl_easy_getinfo(handle, CURLINFO_REDIRECT_COUNT, &redirects);
    curl_easy_getinfo(handle, CURLINFO_HEADER_SIZE, &header_bytes);
    return code == CURLE_SEND_ERROR && new_connections == 0 && redirects == 0 && header_bytes == 0;
}

using handle_source = transfer_handle::source;

constexpr int64_t failed = -1;
constexpr int64_t stale = -2;

// One attempt: the response code, with the body in received, or one of these. What is stale has
// left no trace.
int64_t attempt(const http_request &request, handle_source from, error_text &error,
                string_buffer *received)
{
    certificate_store certificates = trusted_certificates(request.url);
    response_body body(received);
    transfer_handle handle(certificates.get(), from);
    if (!handle.get() || !prepare(handle.get(), request, certificates.get(), error, body))
        return failed;
    error_text before = error;
    CURLcode code = curl_easy_perform(handle.get());
    if (code != CURLE_OK && handle.is_used() && was_stale(handle.get(), code)) {
        error = before;
        return stale;
    }
    if (code != CURLE_OK) {
        report_failure(code, error);
        return failed;
    }
    long response_code = 0;
    curl_easy_getinfo(handle.get(), CURLINFO_RESPONSE_CODE, &response_code);
    handle.keep();
    return response_code;
}

void hand_over(owned_buffer received, char **response, uint64_t *response_length)
{
    *response = received->bytes;
    *response_length = received->length;
    string_delete(received.release(), 0);
}

} // namespace

} // namespace quillmere

using namespace quillmere;

int64_t get_response_from_url(const char *url, const void *body, uint64_t body_length,
                              char **response, uint64_t *response_length, int64_t timeout_seconds)
{
    *response = nullptr;
    *response_length = 0;
    if (!url || std::strlen(url) < shortest_url)
        return -1;

    http_request request = {url, body, body_length, timeout_seconds};
    error_text error;
    // Without a pause between attempts, deliberately: how long to wait is for the caller to know.
    handle_source from = handle_source::kept;
    for (int32_t left = ca_cert_pem_path.connection_attempts; left > 0; --left) {
        owned_buffer received(string_new(0));
        int64_t response_code = attempt(request, from, error, received.get());
        from = handle_source::fresh; // whatever failed, the next must not depend on what was kept
        if (response_code == stale)
            response_code = attempt(request, from, error, received.get());
        if (response_code >= 0) {
            hand_over(std::move(received), response, response_length);
            return response_code;
        }
    }
    return -1;
}

size_t curl_write_function(char *data, size_t size, size_t count, void *buffer)
{
    string_append_len(static_cast<string_buffer *>(buffer), data, size * count);
    return size * count;
}
