#include "support/target.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>

#include <atomic>

// Written out, since not every compiler brings the header. Null where no sanitizer is linked in.
extern "C" {
__attribute__((weak)) int
__sanitizer_install_malloc_and_free_hooks(void (*taken)(const volatile void *, size_t),
                                          void (*given_back)(const volatile void *));
__attribute__((weak)) size_t __sanitizer_get_allocated_size(const volatile void *);
}

namespace quillmere_fuzz {

namespace {

std::vector<target> &all_targets()
{
    static std::vector<target> targets;
    return targets;
}

// Signed, since a call may give back what was taken before it.
std::atomic<int64_t> held{0};
std::atomic<int64_t> most_held{0};

extern "C" {
static void count_taken(const volatile void *, size_t size)
{
    int64_t now = held += static_cast<int64_t>(size);
    if (now > most_held)
        most_held = now;
}

static void count_given_back(const volatile void *block)
{
    if (block)
        held -= static_cast<int64_t>(__sanitizer_get_allocated_size(block));
}
}

bool counts_memory()
{
    static const bool counts =
        __sanitizer_install_malloc_and_free_hooks && __sanitizer_get_allocated_size &&
        __sanitizer_install_malloc_and_free_hooks(count_taken, count_given_back) > 0;
    return counts;
}

double processor_seconds()
{
    timespec now = {};
    ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) / 1e9;
}

void expect_at_most(double spent, double allowed, const char *what)
{
    if (spent <= allowed)
        return;
    std::fprintf(stderr, "%s: %g where %g is allowed\n", what, spent, allowed);
    std::abort();
}

} // namespace

known_target::known_target(const char *name, void (*try_input)(std::string_view input))
{
    all_targets().push_back({name, try_input});
}

const std::vector<target> &known_targets() { return all_targets(); }

void expect(bool holds, const char *what)
{
    if (holds)
        return;
    std::fprintf(stderr, "does not hold: %s\n", what);
    std::abort();
}

void within_budget(const budget &allowed, size_t bytes, const std::function<void()> &call)
{
    bool counted = counts_memory();
    int64_t held_before = held;
    most_held = held_before;
    double start = processor_seconds();

    call();

    auto share = static_cast<double>(bytes);
    expect_at_most(processor_seconds() - start, allowed.seconds + allowed.seconds_per_byte * share,
                   "seconds");
    if (counted)
        expect_at_most(static_cast<double>(most_held - held_before),
                       static_cast<double>(allowed.memory) +
                           static_cast<double>(allowed.memory_per_byte) * share,
                       "bytes of memory");
}

} // namespace quillmere_fuzz
