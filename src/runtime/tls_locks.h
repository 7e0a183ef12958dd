// The locks that an OpenSSL of the callback-locking generation asks its host program for.
// From 1.1.0 on OpenSSL locks for itself and its headers turn the installing calls into nothing;
// the callbacks stay, for both generations.
#pragma once

#include <cstdint>

#include <pthread.h>

// OpenSSL's name for a lock of the host program's own kind.
struct CRYPTO_dynlock_value {
    pthread_mutex_t mutex;
};

namespace quillmere {

// Bits of the mode that the lock callbacks are given. Every lock is exclusive, so the read and
// write bits do not count.
inline constexpr int lock_bit = 1;
inline constexpr int unlock_bit = 2;

// Null until tls_init() has made them.
extern pthread_mutex_t *tls_mutexes;
extern int32_t tls_locks_installed;

// Whether libcurl's TLS runs on the very OpenSSL that we call ourselves, so that objects of the one
// may be given to the other. Known after tls_init().
extern bool shares_openssl_with_libcurl;

extern "C" {
void tls_locking_callback(int mode, int index, const char *file, int line);
unsigned long tls_thread_id_callback();
CRYPTO_dynlock_value *dynamic_lock_create_callback(const char *file, int line);
void dynamic_lock_callback(int mode, CRYPTO_dynlock_value *lock, const char *file, int line);
void dynamic_lock_destroy_callback(CRYPTO_dynlock_value *lock, const char *file, int line);
}

} // namespace quillmere
