// The share handle and the locks that libcurl takes through it.
#include <gtest/gtest.h>

#include <curl/curl.h>

#include <unistd.h>

#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "quillmere.h"
#include "support/library_fixture.h"
#include "support/log_capture.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

constexpr int32_t shared_kinds[] = {CURL_LOCK_DATA_DNS, CURL_LOCK_DATA_SSL_SESSION,
                                    CURL_LOCK_DATA_SHARE};

int32_t lock(int32_t kind, int32_t access = CURL_LOCK_ACCESS_SINGLE)
{
    return curl_sh_lock_function(nullptr, kind, access, nullptr);
}

int32_t unlock(int32_t kind)
{
    return curl_sh_unlock_function(nullptr, kind, CURL_LOCK_ACCESS_NONE, nullptr);
}

TEST(ShareLocks, ServeTheSharedKindsInSilence)
{
    log_capture log;

    for (int32_t kind : shared_kinds) {
        EXPECT_EQ(lock(kind), 0);
        EXPECT_EQ(unlock(kind), 0);
    }

    EXPECT_EQ(log.text(), "");
}

class OtherKind : public testing::TestWithParam<int32_t> {};

TEST_P(OtherKind, IsServedTooAndLogged)
{
    log_capture log;
    std::string kind = std::to_string(GetParam());

    EXPECT_EQ(lock(GetParam()), 0);
    EXPECT_EQ(log.text(), "Locking unexpected curl share lock type: " + kind + "\n");

    log.clear();
    EXPECT_EQ(unlock(GetParam()), 0);
    EXPECT_EQ(log.text(), "Unlocking unexpected curl share lock type: " + kind + "\n");
}

INSTANTIATE_TEST_SUITE_P(Values, OtherKind,
                         testing::Values(CURL_LOCK_DATA_NONE, CURL_LOCK_DATA_COOKIE,
                                         CURL_LOCK_DATA_CONNECT, CURL_LOCK_DATA_PSL, 99, -1));

TEST(ShareLocks, OfDifferentKindsDoNotWaitForEachOther)
{
    log_capture log;

    // Were any two of these one mutex, the second would wait for ever.
    EXPECT_EQ(lock(CURL_LOCK_DATA_DNS), 0);
    EXPECT_EQ(lock(CURL_LOCK_DATA_SSL_SESSION), 0);
    EXPECT_EQ(lock(CURL_LOCK_DATA_SHARE), 0);
    EXPECT_EQ(lock(CURL_LOCK_DATA_COOKIE), 0);

    for (int32_t kind : shared_kinds)
        EXPECT_EQ(unlock(kind), 0);
    EXPECT_EQ(unlock(CURL_LOCK_DATA_COOKIE), 0);
}

class LockedKind : public testing::TestWithParam<int32_t> {};

TEST_P(LockedKind, IsHeldByOneThreadAtATimeWhateverTheAccess)
{
    constexpr int rounds = 5000;
    log_capture log;
    int32_t kind = GetParam();
    int counter = 0;
    auto count = [&](int32_t access) {
        for (int round = 0; round < rounds; ++round) {
            lock(kind, access);
            // Written through a volatile so that the two steps stay apart.
            volatile int &shared = counter;
            shared = shared + 1;
            unlock(kind);
        }
    };

    std::thread single(count, CURL_LOCK_ACCESS_SINGLE);
    std::thread shared(count, CURL_LOCK_ACCESS_SHARED);
    single.join();
    shared.join();

    EXPECT_EQ(counter, 2 * rounds);
}

// Whether a thread of this process waits for something.
bool waits(pid_t thread)
{
    const std::string path = "/proc/self/task/" + std::to_string(thread) + "/stat";
    const std::string facts = content_of(path);
    return facts.compare(facts.rfind(')'), 3, ") S") == 0;
}

TEST_P(LockedKind, MakesAnotherThreadWait)
{
    std::atomic<pid_t> other{0};
    std::atomic<bool> released{false}, had_it_early{false}, done{false};
    lock(GetParam());

    std::thread wants_it([&] {
        other = ::gettid();
        lock(GetParam());
        had_it_early = !released;
        unlock(GetParam());
        done = true;
        while (!released)
            std::this_thread::yield();
    });
    while (other == 0 || (!done && !waits(other)))
        std::this_thread::yield();
    released = true;
    unlock(GetParam());
    wants_it.join();

    EXPECT_FALSE(had_it_early);
}

INSTANTIATE_TEST_SUITE_P(Kinds, LockedKind,
                         testing::Values(CURL_LOCK_DATA_DNS, CURL_LOCK_DATA_SSL_SESSION,
                                         CURL_LOCK_DATA_SHARE));

using share_handle = std::unique_ptr<CURLSH, CURLSHcode (*)(CURLSH *)>;

TEST(ShareHandle, IsMadeWithoutALogLine)
{
    log_capture log;

    share_handle handle(create_curl_share_init(), curl_share_cleanup);

    EXPECT_NE(handle, nullptr);
    EXPECT_EQ(log.text(), "");
}

TEST(ShareHandle, IsANewOneEachTime)
{
    share_handle first(create_curl_share_init(), curl_share_cleanup);
    share_handle second(create_curl_share_init(), curl_share_cleanup);

    EXPECT_NE(first, second);
}

TEST(ShareHandle, CanServeTransfers)
{
    log_capture log;
    scripted_server server;
    server.answer(http_reply(204, ""));
    share_handle handle(create_curl_share_init(), curl_share_cleanup);
    std::unique_ptr<CURL, void (*)(CURL *)> transfer(curl_easy_init(), curl_easy_cleanup);
    curl_easy_setopt(transfer.get(), CURLOPT_URL, server.base_url().c_str());
    curl_easy_setopt(transfer.get(), CURLOPT_PROXY, "");
    curl_easy_setopt(transfer.get(), CURLOPT_NOSIGNAL, 1L);

    CURLcode share_accepted = curl_easy_setopt(transfer.get(), CURLOPT_SHARE, handle.get());
    CURLcode performed = curl_easy_perform(transfer.get());

    EXPECT_EQ(share_accepted, CURLE_OK);
    EXPECT_EQ(performed, CURLE_OK);
    EXPECT_EQ(log.text(), "");
}

} // namespace
} // namespace quillmere_test
