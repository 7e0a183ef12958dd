#include "runtime/lifecycle.h"

#include <cstdlib>
#include <utility>

#include <curl/curl.h>

#include "runtime/dns_share.h"
#include "runtime/kept_certificates.h"
#include "runtime/kept_handles.h"
#include "runtime/memory.h"

namespace quillmere {

event_handler_record *event_handler = nullptr;

// The application may hand in the very path that is stored, so the copy comes before the release.
static void replace_ca_path(const char *path)
{
    char *copy = string_dup(path);
    std::free(std::exchange(ca_cert_pem_path.path, copy));
}

} // namespace quillmere

using namespace quillmere;

void api_global_init(const char *ca_path)
{
    curl_global_init(CURL_GLOBAL_ALL);
    tls_init();
    drop_kept_handles(); // which hold on to the share handle
    replace_curl_share_handle();
    if (ca_path)
        replace_ca_path(ca_path);
    std::free(event_handler);
    event_handler = allocate_zeroed<event_handler_record>();
}

void api_global_cleanup(void)
{
    drop_kept_handles();
    forget_certificates();
    curl_global_cleanup();
    std::free(std::exchange(ca_cert_pem_path.path, nullptr));
    cleanup_proxy();
    std::free(std::exchange(event_handler, nullptr));
}

void api_thread_init(void) {}

void install_event_handler(event_handler_function function, void *argument)
{
    if (event_handler)
        *event_handler = {function, argument};
}
