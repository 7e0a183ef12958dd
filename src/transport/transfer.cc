#include "transport/transfer.h"

#include <strings.h>

#include "runtime/dns_share.h"

namespace quillmere {

namespace {

constexpr long dns_cache_seconds = 300;
constexpr long most_redirects = 30;

// Called once a connection stands and before the request goes out: from an encrypted hop on, only
// encrypted ones may follow.
extern "C" {
static int keep_encrypted(void *handle, char *, char *, int, int)
{
    const char *scheme = nullptr;
    curl_easy_getinfo(static_cast<CURL *>(handle), CURLINFO_SCHEME, &scheme);
    if (scheme && strcasecmp(scheme, "https") == 0)
        curl_easy_setopt(static_cast<CURL *>(handle), CURLOPT_REDIR_PROTOCOLS_STR, "https");
    return CURL_PREREQFUNC_OK;
}
}

} // namespace

void share_dns_cache(CURL *handle)
{
    if (!curl_share_handle)
        return;
    curl_easy_setopt(handle, CURLOPT_SHARE, curl_share_handle);
    curl_easy_setopt(handle, CURLOPT_DNS_CACHE_TIMEOUT, dns_cache_seconds);
}

void restrain_redirects(CURL *handle)
{
    curl_easy_setopt(handle, CURLOPT_MAXREDIRS, most_redirects);
    curl_easy_setopt(handle, CURLOPT_REDIR_PROTOCOLS_STR, "http,https");
    curl_easy_setopt(handle, CURLOPT_PREREQFUNCTION, keep_encrypted);
    curl_easy_setopt(handle, CURLOPT_PREREQDATA, handle);
}

void use_proxy(CURL *handle)
{
    if (!proxy_server.enabled)
        return;
    curl_easy_setopt(handle, CURLOPT_PROXY, proxy_server.host);
    curl_easy_setopt(handle, CURLOPT_PROXYPORT, static_cast<long>(proxy_server.port));
    if (proxy_server.user)
        curl_easy_setopt(handle, CURLOPT_PROXYUSERNAME, proxy_server.user);
    if (proxy_server.password)
        curl_easy_setopt(handle, CURLOPT_PROXYPASSWORD, proxy_server.password);
}

void verify_peer(CURL *handle)
{
    if (ca_cert_pem_path.path)
        curl_easy_setopt(handle, CURLOPT_CAINFO, ca_cert_pem_path.path);
    else
        curl_easy_setopt(handle, CURLOPT_SSL_VERIFYPEER, 0L);
}

void log_failure(CURLcode code, const error_text &error)
{
    qm_printf("cUrl error: (%d) %s: %s\n", code, curl_easy_strerror(code), error.text);
}

} // namespace quillmere
