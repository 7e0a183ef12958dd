/* Reaches the library as most programs do: by its names. */
#include "interface/caller.h"

static void configure(const struct settings *settings)
{
    urls[1] = settings->base;
    get_device_status_uri = "/moved/status.php";
    api_version = "9.9";
    ssl_disabled = settings->ssl_disabled;
    check_api_error = settings->hook;
    output_file = settings->log;
    ca_cert_pem_path.default_timeout = 10;
    ca_cert_pem_path.connection_attempts = 2;
    debug_replace_get_response_from_url = &urls;
    if (settings->proxy_port != 0) {
        set_user_proxy(NULL, settings->proxy_port, NULL, NULL);
        proxy_server.enabled = 1;
    }
}

struct device_status ask_for_device_status(const struct settings *settings)
{
    struct device_status result;
    configure(settings);
    api_global_init(settings->ca_path);
    result.status = get_device_status("token", 7, &result.revision, &result.busy, &result.error);
    api_global_cleanup();
    return result;
}
