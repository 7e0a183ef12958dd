// The process-wide configuration: exported variables with their initial values, and the setters
// that guard some of them. Nothing is locked, since an application configures the library before
// its threads use it.
#include <cstdlib>

#include "quillmere.h"
#include "runtime/memory.h"

#define UPLOAD_PATH "/api/upload/upload.php?type=desktop"

const char *api_version = "2";

const char *urls[4] = {
    "http://" QUILLMERE_SERVICE_HOST,
    "https://" QUILLMERE_SERVICE_HOST,
    "http://" QUILLMERE_SERVICE_HOST UPLOAD_PATH,
    "https://" QUILLMERE_SERVICE_HOST UPLOAD_PATH,
};

api_error_hook check_api_error = check_api_error_empty;
proxy_settings proxy_server = {};
int32_t ssl_disabled = 0;
void *debug_replace_get_response_from_url = nullptr;
transfer_settings ca_cert_pem_path = {nullptr, 30, 6};

int32_t check_api_error_empty(const char *, const char *, int32_t, const char *) { return 0; }

int32_t set_default_timeout(int64_t seconds)
{
    if (seconds < 1) {
        qm_printf("set_default_timeout error: timeout must be greater than 0\n");
        return 1;
    }
    ca_cert_pem_path.default_timeout = seconds;
    return 0;
}

int32_t set_connection_attempts(int32_t attempts)
{
    if (attempts < 1) {
        qm_printf("set_connection_attempts error: number of attempts must be greater than 0\n");
        return 1;
    }
    ca_cert_pem_path.connection_attempts = attempts;
    return 0;
}

void set_user_proxy(const char *host, int64_t port, const char *user, const char *password)
{
    proxy_server.enabled = 1;
    // This clears enabled again, deliberately: a proxy is described here and switched on by the
    // application.
    cleanup_proxy();
    proxy_server.host = quillmere::try_copy_text(host ? host : "127.0.0.1");
    proxy_server.user = quillmere::try_copy_text(user);
    proxy_server.password = quillmere::try_copy_text(password);
    proxy_server.port = port == 0 ? 80 : port;
}

void disable_user_proxy(void) { proxy_server.enabled = 0; }

void cleanup_proxy(void)
{
    std::free(proxy_server.user);
    std::free(proxy_server.password);
    std::free(proxy_server.host);
    proxy_server = {};
}
