#include "interpose/heap.h"

#include "interpose/ration.h"
#include "interpose/real_heap.h"

namespace quillmere_test {
namespace {

thread_local ration allocations;
thread_local int64_t held = 0;

bool refuse() { return allocations.refuses(); }

void *counted(void *block)
{
    if (block)
        ++held;
    return block;
}

} // namespace

starved_heap::starved_heap(size_t allowed, size_t refusals)
{
    allocations = {allowed, refusals, 0};
}

starved_heap::~starved_heap() { allocations = {}; }

size_t starved_heap::refused() const { return allocations.refused; }

int64_t blocks_held() { return held; }

} // namespace quillmere_test

using namespace quillmere_test;

// The linker gives the library's calls to the __wrap_ names.
extern "C" {

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
