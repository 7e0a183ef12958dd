// quillmere_soak REQUESTS UPLOADS: that many requests over TLS and that many uploads, on sixteen
// threads. Fails if an answer is wrong, or if the process holds more at the end than it did when it
// was warm.
#include <pthread.h>
#include <stdlib.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <thread>
#include <vector>

#include "api/questions.h"
#include "soak/held.h"
#include "soak/uploads.h"
#include "support/bound_socket.h"
#include "support/library_fixture.h"
#include "support/quick_server.h"
#include "support/unread_log.h"

namespace quillmere_test {
namespace {

constexpr unsigned thread_count = 16;
constexpr unsigned round_count = 20;
constexpr unsigned warm_after = 5;
constexpr uint16_t tls_upload_port = 443;

struct work {
    unsigned requests;
    unsigned uploads;
};

// The library on servers in processes of their own, so that this process holds nothing of theirs.
class soaked_library {
public:
    soaked_library()
    {
        if (tls_uploads_)
            tls_upload_server_ = std::make_unique<quick_server_process>(
                answer_to_upload,
                on_port(tls_upload_port, on_address(address_, tls_with(certificate_))));
        upload_url_ = plain_upload_server_.base_url() + "/upload?type=desktop";
        tls_upload_url_ = url_of("https", address_, tls_upload_port) + "/upload?type=desktop";
        urls[1] = server_.base_url().c_str();
        urls[2] = upload_url_.c_str();
        urls[3] = tls_upload_url_.c_str();
        set_default_timeout(60);
    }

    // Uploads over TLS go to a port that not every system lets us have.
    bool tls_uploads() const { return tls_uploads_; }

private:
    static bool may_have(const std::string &address, uint16_t port)
    {
        try {
            bound_socket(address, port);
            return true;
        } catch (const std::system_error &) {
            return false;
        }
    }

    proxyless_environment environment_;
    globals_guard globals_;
    unread_log log_;
    std::string address_ = address_of_this_process();
    bool tls_uploads_ = may_have(address_, tls_upload_port);
    certificate certificate_ = test_root().issue({{address_}});
    quick_server_process server_{answer_to, tls_with(loopback_certificate())};
    quick_server_process plain_upload_server_{answer_to_upload};
    std::unique_ptr<quick_server_process> tls_upload_server_;
    std::string upload_url_;
    std::string tls_upload_url_;
    running_library library_{test_root_path().c_str()};
};

// Threads that stay from round to round and wait between them, so that each round ends in a moment
// at which nothing is going on.
class soaking_threads {
public:
    soaking_threads(work round, bool tls_uploads) : round_(round), tls_uploads_(tls_uploads)
    {
        ::pthread_barrier_init(&start_, nullptr, thread_count + 1);
        ::pthread_barrier_init(&end_, nullptr, thread_count + 1);
        for (unsigned each = 0; each < thread_count; ++each)
            threads_.emplace_back(&soaking_threads::work_in_rounds, this);
    }
    ~soaking_threads()
    {
        done_ = true;
        ::pthread_barrier_wait(&start_);
        for (std::thread &each : threads_)
            each.join();
        ::pthread_barrier_destroy(&start_);
        ::pthread_barrier_destroy(&end_);
    }
    soaking_threads(const soaking_threads &) = delete;
    soaking_threads &operator=(const soaking_threads &) = delete;

    // One round: how many answers were wrong.
    unsigned work_once()
    {
        next_ = 0;
        wrong_ = 0;
        ::pthread_barrier_wait(&start_);
        ::pthread_barrier_wait(&end_);
        return wrong_;
    }

private:
    void work_in_rounds()
    {
        for (;;) {
            ::pthread_barrier_wait(&start_);
            if (done_)
                return;
            for (unsigned each = next_++; each < round_.requests + round_.uploads; each = next_++)
                wrong_ += is_right(each) ? 0 : 1;
            ::pthread_barrier_wait(&end_);
        }
    }

    // Uploads come first in a round, since they take longest.
    bool is_right(unsigned number) const
    {
        if (number < round_.uploads)
            return upload_arrives(number, tls_uploads_ && number % 2 == 0);
        return questions[number % question_count](number);
    }

    work round_;
    bool tls_uploads_;
    pthread_barrier_t start_;
    pthread_barrier_t end_;
    bool done_ = false; // written and read on two sides of a barrier
    std::atomic<unsigned> next_{0};
    std::atomic<unsigned> wrong_{0};
    std::vector<std::thread> threads_;
};

void print(unsigned round, work each, const held &now)
{
    std::printf("%8u requests %6u uploads: %7zu KiB resident, %6zu KiB in use, %zu descriptors, "
                "%zu threads\n",
                round * each.requests, round * each.uploads, now.resident / 1024, now.in_use / 1024,
                now.descriptors, now.threads);
    std::fflush(stdout);
}

int soak(work all)
{
    const soaked_library library;
    if (!library.tls_uploads())
        std::puts("port 443 may not be bound here: no upload goes over TLS");
    const work each = {(all.requests + round_count - 1) / round_count,
                       (all.uploads + round_count - 1) / round_count};
    soaking_threads threads(each, library.tls_uploads());
    std::vector<held> moments;
    unsigned wrong = 0;
    for (unsigned round = 1; round <= round_count; ++round) {
        wrong += threads.work_once();
        const held now = held_now();
        print(round, each, now);
        if (round >= warm_after)
            moments.push_back(now);
    }
    const std::string grown = growth_in(moments);
    std::printf("%u wrong answers\n%s", wrong, grown.c_str());
    return wrong == 0 && grown.empty() ? EXIT_SUCCESS : EXIT_FAILURE;
}

} // namespace
} // namespace quillmere_test

// The heap keeps a few freed blocks of every size for each thread, and counts them as in use. It
// takes long until these are filled, so this process does without.
static void do_without_kept_blocks(char **arguments)
{
    const char *const tunables = "GLIBC_TUNABLES";
    if (std::getenv(tunables))
        return;
    ::setenv(tunables, "glibc.malloc.tcache_count=0", 1);
    ::execv("/proc/self/exe", arguments);
}

int main(int count, char **arguments)
{
    do_without_kept_blocks(arguments);
    if (count != 3) {
        std::fputs("usage: quillmere_soak REQUESTS UPLOADS\n", stderr);
        return EXIT_FAILURE;
    }
    auto number_in = [](const char *text) {
        return static_cast<unsigned>(std::strtoul(text, nullptr, 10));
    };
    return quillmere_test::soak({number_in(arguments[1]), number_in(arguments[2])});
}
