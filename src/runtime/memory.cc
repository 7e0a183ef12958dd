#include "runtime/memory.h"

#include <cstdlib>
#include <cstring>

#include <unistd.h>

#include "quillmere.h"

namespace quillmere {

void out_of_memory()
{
    // Not through stdio, which may want to allocate a buffer.
    static const char message[] = "quillmere: out of memory\n";
    [[maybe_unused]] ssize_t written = write(STDERR_FILENO, message, sizeof message - 1);
    std::abort();
}

static void *checked(void *memory)
{
    if (!memory)
        out_of_memory();
    return memory;
}

void *allocate(uint64_t size) { return checked(std::malloc(size)); }

void *allocate_zeroed(uint64_t size) { return checked(std::calloc(1, size)); }

void *reallocate(void *memory, uint64_t size) { return checked(std::realloc(memory, size)); }

void *try_allocate_zeroed(uint64_t count, uint64_t size) { return std::calloc(count, size); }

char *try_copy_text(const char *text) { return text ? strdup(text) : nullptr; }

} // namespace quillmere

void api_free(void *memory) { std::free(memory); }
