#include "runtime/tls_locks.h"

#include <cstdlib>
#include <cstring>
#include <memory>

#include <curl/curl.h>
#include <openssl/crypto.h>

#include "owned.h"
#include "quillmere.h"
#include "runtime/memory.h"

namespace quillmere {

pthread_mutex_t *tls_mutexes = nullptr;
int32_t tls_locks_installed = 0;
bool shares_openssl_with_libcurl = false;

namespace {

// Arrays that a later tls_init() replaced. They are never released, since OpenSSL may be holding
// one of their locks, but they stay known to the process.
struct superseded_mutexes {
    pthread_mutex_t *mutexes;
    superseded_mutexes *earlier;
};
superseded_mutexes *superseded = nullptr;

// False if there is no memory to remember the present array by.
bool keep_superseded()
{
    if (!tls_mutexes)
        return true;
    auto *kept =
        static_cast<superseded_mutexes *>(try_allocate_zeroed(1, sizeof(superseded_mutexes)));
    if (!kept)
        return false;
    *kept = {tls_mutexes, superseded};
    superseded = kept;
    return true;
}

// libcurl's "OpenSSL/3.0.19", perhaps with further libraries behind it, against OpenSSL's own
// "OpenSSL 3.0.19 27 Jan 2026".
bool is_our_openssl(const char *ssl_version)
{
    constexpr size_t name = sizeof "OpenSSL/" - 1;
    const char *ours = SSLeay_version(0);
    size_t length = std::strcspn(ssl_version, " ");
    return std::strncmp(ssl_version, "OpenSSL/", name) == 0 &&
           std::strncmp(ours, "OpenSSL ", name) == 0 &&
           std::strncmp(ours + name, ssl_version + name, length - name) == 0 && ours[length] == ' ';
}

using mutex_array = std::unique_ptr<pthread_mutex_t, releaser<free_memory>>;

bool make_tls_mutexes()
{
    mutex_array mutexes(static_cast<pthread_mutex_t *>(
        try_allocate_zeroed(static_cast<uint64_t>(CRYPTO_num_locks()), sizeof(pthread_mutex_t))));
    if (!mutexes || !keep_superseded())
        return false;
    tls_mutexes = mutexes.release();
    for (int index = 0; index < CRYPTO_num_locks(); ++index)
        pthread_mutex_init(&tls_mutexes[index], nullptr);
    return true;
}

} // namespace

extern "C" {

void tls_locking_callback(int mode, int index, const char *, int)
{
    if (mode & lock_bit) {
        if (int code = pthread_mutex_lock(&tls_mutexes[index]))
            qm_printf("Locking mutex failed with code: %d\n", code);
    } else if (mode & unlock_bit) {
        if (int code = pthread_mutex_unlock(&tls_mutexes[index]))
            qm_printf("Unlocking mutex failed with code: %d\n", code);
    } else {
        qm_printf("Unexpected lock code: %d", mode); // deliberately without a line end
    }
}

unsigned long tls_thread_id_callback() { return static_cast<unsigned long>(pthread_self()); }

CRYPTO_dynlock_value *dynamic_lock_create_callback(const char *, int)
{
    auto *lock = allocate_zeroed<CRYPTO_dynlock_value>();
    pthread_mutex_init(&lock->mutex, nullptr);
    return lock;
}

void dynamic_lock_callback(int mode, CRYPTO_dynlock_value *lock, const char *, int)
{
    if (mode & lock_bit) {
        if (int code = pthread_mutex_lock(&lock->mutex))
            qm_printf("Locking dynamic mutex failed with code: %d\n", code);
    } else if (mode & unlock_bit) {
        if (int code = pthread_mutex_unlock(&lock->mutex))
            qm_printf("Unlocking dynamic mutex failed with code: %d\n", code);
    } else {
        qm_printf("Unexpected dynamic lock code: %d", mode); // deliberately without a line end
    }
}

void dynamic_lock_destroy_callback(CRYPTO_dynlock_value *lock, const char *, int)
{
    pthread_mutex_destroy(&lock->mutex);
    std::free(lock);
}

} // extern "C"

} // namespace quillmere

using namespace quillmere;

int32_t tls_init(void)
{
    const char *ssl_version = curl_version_info(CURLVERSION_FOURTH)->ssl_version;
    qm_printf("Curl SSL version: %s\n", ssl_version);
    shares_openssl_with_libcurl = ssl_version && is_our_openssl(ssl_version);
    if (!ssl_version || std::strncmp(ssl_version, "OpenSSL", 7) != 0) {
        qm_printf("No OpenSSL support.\n");
        return 0;
    }
    qm_printf("OpenSSL version: %s\n", SSLeay_version(0));
    qm_printf("OpenSSL version num: %lx.\n", SSLeay());
    qm_printf("Mutex locks requested: %d.\n", CRYPTO_num_locks());

    if (!make_tls_mutexes()) {
        qm_printf("Unable to create mutexes.\n");
        return -1;
    }

    tls_locks_installed = 1;
    CRYPTO_set_locking_callback(tls_locking_callback);
    qm_printf("Using deprecated OpenSSL.\n");
    CRYPTO_set_id_callback(tls_thread_id_callback);

    if (tls_locks_installed) {
        CRYPTO_set_dynlock_create_callback(dynamic_lock_create_callback);
        CRYPTO_set_dynlock_lock_callback(dynamic_lock_callback);
        CRYPTO_set_dynlock_destroy_callback(dynamic_lock_destroy_callback);
    } else {
        qm_printf("Not using openSSL. Not able to set locks.\n");
    }
    return 0;
}
