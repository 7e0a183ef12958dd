// The locks for the TLS library, whether or not the one at hand asks for them.
#include <gtest/gtest.h>

#include <cerrno>
#include <string>
#include <thread>

#include <curl/curl.h>
#include <openssl/crypto.h>

#include "interpose/heap.h"
#include "interpose/libcurl.h"
#include "quillmere.h"
#include "runtime/tls_locks.h"
#include "support/log_capture.h"

// Two tests make the callbacks fail on purpose, by unlocking what is not locked, which the thread
// sanitizer would report. It asks this function, if there is one, what to leave out.
extern "C" const char *__tsan_default_suppressions();
extern "C" const char *__tsan_default_suppressions()
{
    return "mutex:tls_locking_callback\nmutex:dynamic_lock_callback\n";
}

namespace quillmere_test {
namespace {

using namespace quillmere;

constexpr int lock_mode = 1;
constexpr int unlock_mode = 2;
constexpr int read_mode = 4;
constexpr int write_mode = 8;

// A mutex that reports misuse instead of waiting for ever or going wrong.
void make_error_checking(pthread_mutex_t *mutex)
{
    pthread_mutexattr_t attributes;
    pthread_mutexattr_init(&attributes);
    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_ERRORCHECK);
    pthread_mutex_destroy(mutex);
    pthread_mutex_init(mutex, &attributes);
    pthread_mutexattr_destroy(&attributes);
}

bool is_locked(pthread_mutex_t *mutex)
{
    bool locked = false;
    // On another thread, so that it does not matter which kind of mutex it is.
    std::thread([&] {
        locked = pthread_mutex_trylock(mutex) == EBUSY;
        if (!locked)
            pthread_mutex_unlock(mutex);
    }).join();
    return locked;
}

class OtherTlsLibrary : public testing::TestWithParam<const char *> {
protected:
    log_capture log;
    pretended_libcurl libcurl;
};

TEST_P(OtherTlsLibrary, IsNamedAndGetsNoLocks)
{
    libcurl.ssl_version = GetParam();
    pthread_mutex_t *mutexes_before = tls_mutexes;
    int32_t installed_before = tls_locks_installed;

    int32_t result = tls_init();

    EXPECT_EQ(result, 0);
    EXPECT_EQ(log.text(),
              std::string("Curl SSL version: ") + GetParam() + "\nNo OpenSSL support.\n");
    EXPECT_EQ(tls_mutexes, mutexes_before);
    EXPECT_EQ(tls_locks_installed, installed_before);
}

INSTANTIATE_TEST_SUITE_P(Versions, OtherTlsLibrary,
                         testing::Values("GnuTLS/3.7.9", "", "OpenSS", "openssl/3.0.11",
                                         "(OpenSSL/3.0.11) Schannel"));

class TlsLocks : public testing::Test {
protected:
    log_capture log;
    pretended_libcurl libcurl;

    TlsLocks()
    {
        libcurl.ssl_version = "OpenSSL/3.0.11";
        tls_init();
        log.clear();
    }
};

TEST_F(TlsLocks, AreInstalledForAnOpenSslOfAnyVersion)
{
    libcurl.ssl_version = "OpenSSL";

    EXPECT_EQ(tls_init(), 0);

    EXPECT_EQ(log.text().find("Curl SSL version: OpenSSL\nOpenSSL version: "), 0u);
    EXPECT_NE(tls_mutexes, nullptr);
    EXPECT_EQ(tls_locks_installed, 1);
}

TEST_F(TlsLocks, AskLibcurlForItsVersionRecordOfAgeThree)
{
    tls_init();

    EXPECT_EQ(static_cast<int>(libcurl.asked_age), 3);
}

TEST_F(TlsLocks, AreReplacedByANewInstallation)
{
    pthread_mutex_t *first = tls_mutexes;

    tls_init();

    EXPECT_NE(tls_mutexes, first);
    EXPECT_EQ(pthread_mutex_trylock(&first[0]), 0); // still there for whoever holds on to it
    pthread_mutex_unlock(&first[0]);
}

TEST_F(TlsLocks, AreUsableEachOfThem)
{
    for (int index = 0; index < CRYPTO_num_locks(); ++index) {
        tls_locking_callback(lock_mode, index, __FILE__, __LINE__);
        EXPECT_TRUE(is_locked(&tls_mutexes[index]));
        tls_locking_callback(unlock_mode, index, __FILE__, __LINE__);
        EXPECT_FALSE(is_locked(&tls_mutexes[index]));
    }

    EXPECT_EQ(log.text(), "");
}

TEST_F(TlsLocks, AreExclusiveForReadersAndWriters)
{
    for (int access : {read_mode, write_mode}) {
        tls_locking_callback(lock_mode | access, 0, __FILE__, __LINE__);
        EXPECT_TRUE(is_locked(&tls_mutexes[0]));
        tls_locking_callback(unlock_mode | access, 0, __FILE__, __LINE__);
        EXPECT_FALSE(is_locked(&tls_mutexes[0]));
    }

    EXPECT_EQ(log.text(), "");
}

TEST_F(TlsLocks, LookAtTheLockBitFirst)
{
    tls_locking_callback(lock_mode | unlock_mode, 0, __FILE__, __LINE__);

    EXPECT_TRUE(is_locked(&tls_mutexes[0]));
    tls_locking_callback(unlock_mode, 0, __FILE__, __LINE__);
}

TEST_F(TlsLocks, LogAFailureToLock)
{
    make_error_checking(&tls_mutexes[0]);
    tls_locking_callback(lock_mode, 0, __FILE__, __LINE__);

    tls_locking_callback(lock_mode, 0, __FILE__, __LINE__);

    EXPECT_EQ(log.text(), "Locking mutex failed with code: " + std::to_string(EDEADLK) + "\n");
    tls_locking_callback(unlock_mode, 0, __FILE__, __LINE__);
}

TEST_F(TlsLocks, LogAFailureToUnlock)
{
    make_error_checking(&tls_mutexes[0]);

    tls_locking_callback(unlock_mode, 0, __FILE__, __LINE__);

    EXPECT_EQ(log.text(), "Unlocking mutex failed with code: " + std::to_string(EPERM) + "\n");
}

class UnexpectedMode : public TlsLocks, public testing::WithParamInterface<int> {};

TEST_P(UnexpectedMode, OnlyGetsALogTextWithoutALineEnd)
{
    tls_locking_callback(GetParam(), 0, __FILE__, __LINE__);

    EXPECT_EQ(log.text(), "Unexpected lock code: " + std::to_string(GetParam()));
    EXPECT_FALSE(is_locked(&tls_mutexes[0]));
}

TEST_P(UnexpectedMode, OfADynamicLockOnlyGetsALogTextWithoutALineEnd)
{
    CRYPTO_dynlock_value *lock = dynamic_lock_create_callback(__FILE__, __LINE__);

    dynamic_lock_callback(GetParam(), lock, __FILE__, __LINE__);

    EXPECT_EQ(log.text(), "Unexpected dynamic lock code: " + std::to_string(GetParam()));
    EXPECT_FALSE(is_locked(&lock->mutex));
    dynamic_lock_destroy_callback(lock, __FILE__, __LINE__);
}

INSTANTIATE_TEST_SUITE_P(Modes, UnexpectedMode,
                         testing::Values(0, read_mode, write_mode, read_mode | write_mode, -4));

TEST_F(TlsLocks, KnowAThreadByItsPosixNumber)
{
    unsigned long here = tls_thread_id_callback();
    unsigned long there = 0;
    unsigned long expected_there = 0;
    std::thread([&] {
        there = tls_thread_id_callback();
        expected_there = static_cast<unsigned long>(pthread_self());
    }).join();

    EXPECT_EQ(here, static_cast<unsigned long>(pthread_self()));
    EXPECT_EQ(there, expected_there);
    EXPECT_NE(here, there);
}

class DynamicLock : public testing::Test {
protected:
    ~DynamicLock() override { dynamic_lock_destroy_callback(lock, __FILE__, __LINE__); }

    log_capture log;
    CRYPTO_dynlock_value *lock = dynamic_lock_create_callback(nullptr, 0);
};

TEST_F(DynamicLock, IsOneMutex) { EXPECT_EQ(sizeof *lock, sizeof(pthread_mutex_t)); }

TEST(DynamicLockMemory, IsOneBlockThatIsGivenBack)
{
    int64_t before = blocks_held();

    CRYPTO_dynlock_value *lock = dynamic_lock_create_callback(__FILE__, __LINE__);
    EXPECT_EQ(blocks_held(), before + 1);

    dynamic_lock_destroy_callback(lock, __FILE__, __LINE__);
    EXPECT_EQ(blocks_held(), before);
}

TEST_F(DynamicLock, IsLockedAndUnlocked)
{
    dynamic_lock_callback(lock_mode, lock, __FILE__, __LINE__);
    EXPECT_TRUE(is_locked(&lock->mutex));

    dynamic_lock_callback(unlock_mode, lock, __FILE__, __LINE__);
    EXPECT_FALSE(is_locked(&lock->mutex));

    EXPECT_EQ(log.text(), "");
}

TEST_F(DynamicLock, IsExclusiveForReaders)
{
    dynamic_lock_callback(lock_mode | read_mode, lock, __FILE__, __LINE__);
    EXPECT_TRUE(is_locked(&lock->mutex));

    dynamic_lock_callback(unlock_mode | read_mode, lock, __FILE__, __LINE__);
    EXPECT_FALSE(is_locked(&lock->mutex));
}

TEST_F(DynamicLock, LogsAFailureToLock)
{
    make_error_checking(&lock->mutex);
    dynamic_lock_callback(lock_mode, lock, __FILE__, __LINE__);

    dynamic_lock_callback(lock_mode, lock, __FILE__, __LINE__);

    EXPECT_EQ(log.text(),
              "Locking dynamic mutex failed with code: " + std::to_string(EDEADLK) + "\n");
    dynamic_lock_callback(unlock_mode, lock, __FILE__, __LINE__);
}

TEST_F(DynamicLock, LogsAFailureToUnlock)
{
    make_error_checking(&lock->mutex);

    dynamic_lock_callback(unlock_mode, lock, __FILE__, __LINE__);

    EXPECT_EQ(log.text(),
              "Unlocking dynamic mutex failed with code: " + std::to_string(EPERM) + "\n");
}

} // namespace
} // namespace quillmere_test
