#include "transport/transfer.h"

#include <strings.h>

#include "runtime/dns_share.h"
#include "runtime/kept_certificates.h"
#include "runtime/kept_handles.h"
#include "transport/certificate_hook.h"

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

// Whether libcurl had the memory to keep a text. A refusal for any other reason stops no transfer.
bool keep(CURL *handle, CURLoption option, const char *text)
{
    return curl_easy_setopt(handle, option, text) != CURLE_OUT_OF_MEMORY;
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

void keep_no_tls_sessions(CURL *handle)
{
    curl_easy_setopt(handle, CURLOPT_SSL_SESSIONID_CACHE, 0L);
}

bool use_proxy(CURL *handle)
{
    if (!proxy_server.enabled)
        return true;
    bool kept = keep(handle, CURLOPT_PROXY, proxy_server.host);
    curl_easy_setopt(handle, CURLOPT_PROXYPORT, static_cast<long>(proxy_server.port));
    if (proxy_server.user)
        kept &= keep(handle, CURLOPT_PROXYUSERNAME, proxy_server.user);
    if (proxy_server.password)
        kept &= keep(handle, CURLOPT_PROXYPASSWORD, proxy_server.password);
    return kept;
}

bool verify_peer(CURL *handle, X509_STORE *certificates)
{
    if (!ca_cert_pem_path.path) {
        curl_easy_setopt(handle, CURLOPT_SSL_VERIFYPEER, 0L);
        return true;
    }
    // Set in any case, so that whatever goes wrong without it ends as libcurl says.
    if (!keep(handle, CURLOPT_CAINFO, ca_cert_pem_path.path))
        return false;
    if (certificates && takes_certificates_from_memory())
        verify_against(handle, certificates);
    return true;
}

certificate_store trusted_certificates(const char *url)
{
    if (!ca_cert_pem_path.path)
        return nullptr;
    bool verifies = url && strncasecmp(url, "https:", 6) == 0;
    bool used = (verifies && takes_certificates_from_memory()) || keeps_connections();
    return used ? certificates_of(ca_cert_pem_path.path) : nullptr;
}

void log_failure(CURLcode code, const error_text &error)
{
    qm_printf("cUrl error: (%d) %s: %s\n", code, curl_easy_strerror(code), error.text);
}

} // namespace quillmere
