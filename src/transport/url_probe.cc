// Two self-tests that probe a URL once.
#include <cmath>
#include <cstring>

#include "owned.h"
#include "transport/response_body.h"
#include "transport/transfer.h"

namespace quillmere {

namespace {

enum class probe_method { head, get };

// Away from zero, so that a time-out of a millisecond does not become none at all.
int32_t whole_seconds(int32_t milliseconds)
{
    float seconds = static_cast<float>(milliseconds) / 1000.0F;
    return static_cast<int32_t>(seconds < 0 ? std::floor(seconds) : std::ceil(seconds));
}

bool address(CURL *handle, const char *url, probe_method method)
{
    return curl_easy_setopt(handle, CURLOPT_URL, url) == CURLE_OK &&
           curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L) == CURLE_OK &&
           curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L) == CURLE_OK &&
           (method == probe_method::get ||
            curl_easy_setopt(handle, CURLOPT_NOBODY, 1L) == CURLE_OK);
}

long perform(CURL *handle, const error_text &error)
{
    CURLcode code = curl_easy_perform(handle);
    if (code != CURLE_OK) {
        log_failure(code, error);
        return -1;
    }
    long response_code = -1;
    curl_easy_getinfo(handle, CURLINFO_RESPONSE_CODE, &response_code);
    return response_code;
}

// Sets everything up; false if libcurl refuses what the probe cannot do without.
bool prepare(CURL *handle, const char *url, probe_method method, int32_t timeout_milliseconds,
             X509_STORE *certificates, error_text &error, response_body &body)
{
    share_dns_cache(handle);
    curl_easy_setopt(handle, CURLOPT_ERRORBUFFER, error.text);
    if (!address(handle, url, method))
        return false;
    restrain_redirects(handle);
    keep_no_tls_sessions(handle);
    curl_easy_setopt(handle, CURLOPT_TIMEOUT,
                     static_cast<long>(whole_seconds(timeout_milliseconds)));
    if (method == probe_method::get)
        body.receive_with(handle);
    curl_easy_setopt(handle, CURLOPT_NOPROGRESS, 1L);
    return use_proxy(handle) && verify_peer(handle, certificates);
}

// The response code, or -1. A HEAD probe receives no body, so received is for GET alone.
long probe(const char *url, probe_method method, int32_t timeout_milliseconds,
           string_buffer *received)
{
    easy_handle handle(curl_easy_init());
    if (!handle) {
        qm_printf("Could not initialize cUrl.\n");
        return -1;
    }
    certificate_store certificates = trusted_certificates(url);
    error_text error;
    response_body body(received);
    if (!prepare(handle.get(), url, method, timeout_milliseconds, certificates.get(), error,
                 body)) {
        qm_printf("cUrl setopt failed.\n");
        return -1;
    }
    return perform(handle.get(), error);
}

bool equals(const string_buffer *received, const char *expected)
{
    return received->length == std::strlen(expected) &&
           std::memcmp(received->bytes, expected, received->length) == 0;
}

} // namespace

} // namespace quillmere

using namespace quillmere;

int32_t check_url_response_code(const char *url, int32_t timeout_milliseconds)
{
    long response_code = probe(url, probe_method::head, timeout_milliseconds, nullptr);
    if (response_code >= 200 && response_code <= 399)
        return 1;
    qm_printf("Response does not match: %d\n", static_cast<int>(response_code));
    return 0;
}

int32_t check_url_response(const char *base_url, const char *query, const char *expected_body,
                           int32_t timeout_milliseconds)
{
    owned_buffer url(string_new(64));
    string_append(url.get(), base_url);
    string_append(url.get(), "?");
    string_append_urlencode(url.get(), query);
    owned_buffer received(string_new(0));

    long response_code =
        probe(string_get(url.get()), probe_method::get, timeout_milliseconds, received.get());
    if (response_code != 200) {
        // Deliberately without a line end.
        qm_printf("Response does not match because %d does not match 200!",
                  static_cast<int>(response_code));
        return 0;
    }
    string_append(received.get(), ""); // an empty body has no storage yet
    if (equals(received.get(), expected_body))
        return 1;
    qm_printf("Response:\n%s\nDoes not match:\n%s\n", string_get(received.get()), expected_body);
    return 0;
}
