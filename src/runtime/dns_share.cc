#include "runtime/dns_share.h"

#include <type_traits>
#include <utility>

#include <pthread.h>

#include "quillmere.h"

namespace quillmere {

CURLSH *curl_share_handle = nullptr;

void replace_curl_share_handle()
{
    CURLSH *previous = std::exchange(curl_share_handle, create_curl_share_init());
    if (previous)
        curl_share_cleanup(previous);
}

namespace {

pthread_mutex_t dns_lock = PTHREAD_MUTEX_INITIALIZER;
pthread_mutex_t ssl_session_lock = PTHREAD_MUTEX_INITIALIZER;
pthread_mutex_t share_lock = PTHREAD_MUTEX_INITIALIZER;
pthread_mutex_t fallback_lock = PTHREAD_MUTEX_INITIALIZER;

// A mutex for each kind of data, so that one thread's look-up never waits for another kind; null
// for the kinds that are not shared.
pthread_mutex_t *mutex_of(int32_t kind)
{
    switch (kind) {
    case CURL_LOCK_DATA_DNS:
        return &dns_lock;
    case CURL_LOCK_DATA_SSL_SESSION:
        return &ssl_session_lock;
    case CURL_LOCK_DATA_SHARE:
        return &share_lock;
    default:
        return nullptr;
    }
}

// libcurl's callbacks return nothing, ours the result of the mutex call, which libcurl then leaves
// unread. The detour through a function of no arguments tells the compiler that the difference is
// known.
template <class Callback, class Function> Callback *as_libcurl_callback(Function *function)
{
    return reinterpret_cast<Callback *>(reinterpret_cast<void (*)()>(function));
}

using lock_callback = std::remove_pointer_t<curl_lock_function>;
using unlock_callback = std::remove_pointer_t<curl_unlock_function>;

// The handle of a failure is dropped, not cleaned up: libcurl may hold on to callbacks that it half
// accepted.
bool accepted(CURLSHcode code, const char *option)
{
    if (code == CURLSHE_OK)
        return true;
    qm_printf(
        "curl_share_setopt(curl_share_handle, %s) failed with code %d. Unable to share handle.\n",
        option, code);
    return false;
}

} // namespace

} // namespace quillmere

using namespace quillmere;

void *create_curl_share_init(void)
{
    CURLSH *handle = curl_share_init();
    if (!handle)
        return nullptr;
    if (!accepted(curl_share_setopt(handle, CURLSHOPT_LOCKFUNC,
                                    as_libcurl_callback<lock_callback>(curl_sh_lock_function)),
                  "CURLSHOPT_LOCKFUNC, curl_sh_lock_function"))
        return nullptr;
    if (!accepted(curl_share_setopt(handle, CURLSHOPT_UNLOCKFUNC,
                                    as_libcurl_callback<unlock_callback>(curl_sh_unlock_function)),
                  "CURLSHOPT_UNLOCKFUNC, curl_sh_unlock_function"))
        return nullptr;
    if (!accepted(curl_share_setopt(handle, CURLSHOPT_SHARE, CURL_LOCK_DATA_DNS),
                  "CURLSHOPT_SHARE, CURL_LOCK_DATA_DNS"))
        return nullptr;
    return handle;
}

int32_t curl_sh_lock_function(void *, int32_t kind, int32_t, void *)
{
    pthread_mutex_t *mutex = mutex_of(kind);
    if (!mutex) {
        qm_printf("Locking unexpected curl share lock type: %d\n", kind);
        mutex = &fallback_lock;
    }
    return pthread_mutex_lock(mutex);
}

int32_t curl_sh_unlock_function(void *, int32_t kind, int32_t, void *)
{
    pthread_mutex_t *mutex = mutex_of(kind);
    if (!mutex) {
        qm_printf("Unlocking unexpected curl share lock type: %d\n", kind);
        mutex = &fallback_lock;
    }
    return pthread_mutex_unlock(mutex);
}
