// Makes one call of the library with a heap that ends after so many allocations:
// quillmere_exhausted CALL ALLOWED. Everything is released, for the case that the memory suffices.
#include <sys/resource.h>

#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "interpose/heap.h"
#include "quillmere.h"
#include "runtime/tls_locks.h"

#ifdef QUILLMERE_COUNT_COVERAGE
extern "C" void __gcov_dump();
#endif

namespace {

using quillmere_test::starved_heap;

// What the counters of coverage have counted is written at a program's end, which an abort is not.
void keep_counts_of_an_abort()
{
#ifdef QUILLMERE_COUNT_COVERAGE
    std::signal(SIGABRT, [](int) {
        const starved_heap plenty(SIZE_MAX); // writing takes memory
        __gcov_dump();
    });
#endif
}

struct starved_call {
    const char *name;
    void (*make)(size_t allowed);
};

// A call that changes a buffer which was there before the heap ended.
template <class Change> void on_buffer(uint64_t capacity, size_t allowed, const Change &change)
{
    string_buffer *buffer = string_new(capacity);
    {
        starved_heap starved(allowed);
        change(buffer);
    }
    string_delete(buffer, 1);
}

void make_buffer(size_t allowed)
{
    starved_heap starved(allowed);
    string_delete(string_new(16), 1);
}

void append(size_t allowed)
{
    on_buffer(0, allowed, [](string_buffer *buffer) {
        string_append(buffer, "first");
        string_append(buffer, "a text that takes more room");
    });
}

// More than an address space holds, which must not be taken for a small number.
void append_everything(size_t allowed)
{
    on_buffer(0, allowed, [](string_buffer *buffer) {
        string_append(buffer, "x");
        string_append_len(buffer, "x", UINT64_MAX - 1);
    });
}

void append_encoded(size_t allowed)
{
    on_buffer(0, allowed, [](string_buffer *buffer) { string_append_urlencode(buffer, "a b"); });
}

void append_number(size_t allowed)
{
    on_buffer(0, allowed, [](string_buffer *buffer) { string_append_num(buffer, 4096); });
}

void add_range(size_t allowed)
{
    on_buffer(16, allowed, [](string_buffer *buffer) { string_add_obfs_range(buffer, 0, 1); });
}

void append_secret(size_t allowed)
{
    on_buffer(0, allowed, [](string_buffer *buffer) { string_append_obfs(buffer, "secret"); });
}

void redact(size_t allowed)
{
    string_buffer *buffer = string_new(16);
    string_append_obfs(buffer, "secret");
    {
        starved_heap starved(allowed);
        string_get_obfs(buffer, nullptr);
    }
    string_delete(buffer, 1);
}

void duplicate(size_t allowed)
{
    starved_heap starved(allowed);
    api_free(string_dup("text"));
}

void make_record(size_t allowed)
{
    starved_heap starved(allowed);
    system_status *record = system_status_new("Live", "Live");
    system_status_delete(&record);
}

void make_dynamic_lock(size_t allowed)
{
    starved_heap starved(allowed);
    quillmere::dynamic_lock_destroy_callback(quillmere::dynamic_lock_create_callback("", 0), "", 0);
}

void start(size_t allowed)
{
    std::FILE *nowhere = std::fopen("/dev/null", "w");
    set_quillmere_output_file(nowhere);
    {
        starved_heap starved(allowed);
        api_global_init("/somewhere/roots.pem");
    }
    api_global_cleanup();
    set_quillmere_output_file(nullptr);
    std::fclose(nowhere);
}

constexpr starved_call calls[] = {
    {"string_new", make_buffer},
    {"string_append", append},
    {"string_append_len of everything", append_everything},
    {"string_append_urlencode", append_encoded},
    {"string_append_num", append_number},
    {"string_add_obfs_range", add_range},
    {"string_append_obfs", append_secret},
    {"string_get_obfs", redact},
    {"string_dup", duplicate},
    {"system_status_new", make_record},
    {"dynamic lock", make_dynamic_lock},
    {"api_global_init", start},
};

} // namespace

int main(int count, char **arguments)
{
    // The abort is expected, and no core file of it wanted.
    const rlimit no_core = {0, 0};
    setrlimit(RLIMIT_CORE, &no_core);
    keep_counts_of_an_abort();
    if (count != 3)
        return EXIT_FAILURE;
    for (const starved_call &call : calls)
        if (std::strcmp(call.name, arguments[1]) == 0) {
            call.make(std::strtoul(arguments[2], nullptr, 10));
            return EXIT_SUCCESS;
        }
    return EXIT_FAILURE;
}
