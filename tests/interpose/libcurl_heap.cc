#include "interpose/libcurl_heap.h"

#include <curl/curl.h>

#include <atomic>
#include <stdexcept>

#include "interpose/real_heap.h"

namespace quillmere_test {
namespace {

std::atomic<int64_t> held{0};

void *counted(void *block)
{
    if (block)
        ++held;
    return block;
}

extern "C" {
static void *take(size_t size) { return counted(real_malloc(size)); }
static void *take_zeroed(size_t count, size_t size) { return counted(real_calloc(count, size)); }
static char *copy(const char *text) { return static_cast<char *>(counted(real_strdup(text))); }

static void *take_anew(void *block, size_t size)
{
    return block ? real_realloc(block, size) : counted(real_realloc(block, size));
}

static void give_back(void *block)
{
    if (block)
        --held;
    real_free(block);
}
}

} // namespace

counted_libcurl_heap::counted_libcurl_heap()
{
    if (curl_global_init_mem(CURL_GLOBAL_ALL, take, give_back, take_anew, copy, take_zeroed) !=
        CURLE_OK)
        throw std::runtime_error("libcurl does not start");
}

counted_libcurl_heap::~counted_libcurl_heap() { curl_global_cleanup(); }

int64_t counted_libcurl_heap::blocks_held() const { return held; }

} // namespace quillmere_test
