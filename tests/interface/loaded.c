/* Reaches the library as a program does that loads it while it runs. */
#include "interface/caller.h"

#include <dlfcn.h>
#include <stdlib.h>

typedef void (*init_function)(const char *);
typedef void (*cleanup_function)(void);
typedef void (*proxy_function)(const char *, int64_t, const char *, const char *);
typedef int32_t (*device_status_function)(const char *, uint32_t, uint64_t *, int32_t *, char **);

static void *library;

static void *variable(const char *name)
{
    void *found = dlsym(library, name);
    if (found == NULL) {
        fprintf(stderr, "%s\n", dlerror());
        exit(EXIT_FAILURE);
    }
    return found;
}

/* C knows no conversion from a pointer to data to one to a function, but POSIX has both alike. */
union symbol {
    void *data;
    init_function init;
    cleanup_function cleanup;
    proxy_function set_proxy;
    device_status_function device_status;
};

static union symbol function(const char *name)
{
    union symbol found;
    found.data = variable(name);
    return found;
}

static void load(const char *path)
{
    library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
    if (library == NULL) {
        fprintf(stderr, "%s\n", dlerror());
        exit(EXIT_FAILURE);
    }
}

static void configure(const struct settings *settings)
{
    transfer_settings *transfers = (transfer_settings *)variable("ca_cert_pem_path");
    ((const char **)variable("urls"))[1] = settings->base;
    *(const char **)variable("get_device_status_uri") = "/moved/status.php";
    *(const char **)variable("api_version") = "9.9";
    *(int32_t *)variable("ssl_disabled") = settings->ssl_disabled;
    *(api_error_hook *)variable("check_api_error") = settings->hook;
    *(FILE **)variable("output_file") = settings->log;
    *(void **)variable("debug_replace_get_response_from_url") = transfers;
    transfers->default_timeout = 10;
    transfers->connection_attempts = 2;
    if (settings->proxy_port != 0) {
        function("set_user_proxy").set_proxy(NULL, settings->proxy_port, NULL, NULL);
        ((proxy_settings *)variable("proxy_server"))->enabled = 1;
    }
}

struct device_status ask_for_device_status(const struct settings *settings)
{
    struct device_status result;
    load(settings->library);
    configure(settings);
    function("api_global_init").init(settings->ca_path);
    result.status = function("get_device_status")
                        .device_status("token", 7, &result.revision, &result.busy, &result.error);
    function("api_global_cleanup").cleanup();
    return result;
}
