#include "interpose/heap.h"

#include <cstdlib>
#include <cstring>

namespace quillmere_test {
namespace {

thread_local size_t allowed_left = 0;
thread_local size_t refusals_left = 0;
thread_local size_t refusals_made = 0;
thread_local int64_t held = 0;

bool refuse()
{
    if (allowed_left > 0) {
        --allowed_left;
        return false;
    }
    if (refusals_left == 0)
        return false;
    --refusals_left;
    ++refusals_made;
    return true;
}

void *counted(void *block)
{
    if (block)
        ++held;
    return block;
}

} // namespace

starved_heap::starved_heap(size_t allowed, size_t refusals)
{
    allowed_left = allowed;
    refusals_left = refusals;
    refusals_made = 0;
}

starved_heap::~starved_heap() { refusals_left = 0; }

size_t starved_heap::refused() const { return refusals_made; }

int64_t blocks_held() { return held; }

} // namespace quillmere_test

using namespace quillmere_test;

// The linker gives the library's calls to the __wrap_ names and the C library's functions the
// __real_ names.
extern "C" {

void *real_malloc(size_t size) __asm__("__real_malloc");
void *real_calloc(size_t count, size_t size) __asm__("__real_calloc");
void *real_realloc(void *block, size_t size) __asm__("__real_realloc");
char *real_strdup(const char *text) __asm__("__real_strdup");
void real_free(void *block) __asm__("__real_free");

void *counting_malloc(size_t size) __asm__("__wrap_malloc");
void *counting_calloc(size_t count, size_t size) __asm__("__wrap_calloc");
void *counting_realloc(void *block, size_t size) __asm__("__wrap_realloc");
char *counting_strdup(const char *text) __asm__("__wrap_strdup");
void counting_free(void *block) __asm__("__wrap_free");

void *counting_malloc(size_t size) { return refuse() ? nullptr : counted(real_malloc(size)); }

void *counting_calloc(size_t count, size_t size)
{
    return refuse() ? nullptr : counted(real_calloc(count, size));
}

void *counting_realloc(void *block, size_t size)
{
    if (refuse())
        return nullptr;
    return block ? real_realloc(block, size) : counted(real_realloc(block, size));
}

char *counting_strdup(const char *text)
{
    return refuse() ? nullptr : static_cast<char *>(counted(real_strdup(text)));
}

void counting_free(void *block)
{
    if (block)
        --held;
    real_free(block);
}

} // extern "C"
