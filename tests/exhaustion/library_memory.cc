#include "exhaustion/library_memory.h"

#include <cstring>

#include <curl/curl.h>
#include <expat.h>
#include <openssl/crypto.h>

#include "interpose/ration.h"
#include "interpose/real_heap.h"
#include "support/failure.h"

namespace quillmere_test {
namespace {

struct supply {
    ration left;
    int64_t held = 0;
};

supply &supply_of(memory_of library)
{
    thread_local supply supplies[3];
    return supplies[static_cast<size_t>(library)];
}

void *counted(supply &from, void *block)
{
    from.held += block ? 1 : 0;
    return block;
}

void *take(memory_of library, size_t size)
{
    supply &from = supply_of(library);
    return from.left.refuses() ? nullptr : counted(from, real_malloc(size));
}

void *take_more(memory_of library, void *block, size_t size)
{
    if (!block)
        return take(library, size);
    return supply_of(library).left.refuses() ? nullptr : real_realloc(block, size);
}

void give_back(memory_of library, void *block)
{
    supply_of(library).held -= block ? 1 : 0;
    real_free(block);
}

// The names that libcurl, expat and OpenSSL call.
extern "C" {

static void *libcurl_malloc(size_t size) { return take(memory_of::libcurl, size); }

static void *libcurl_realloc(void *block, size_t size)
{
    return take_more(memory_of::libcurl, block, size);
}

static void libcurl_free(void *block) { give_back(memory_of::libcurl, block); }

static void *libcurl_calloc(size_t count, size_t size)
{
    void *block = take(memory_of::libcurl, count * size);
    return block ? std::memset(block, 0, count * size) : nullptr;
}

static char *libcurl_strdup(const char *text)
{
    size_t size = std::strlen(text) + 1;
    void *block = take(memory_of::libcurl, size);
    return static_cast<char *>(block ? std::memcpy(block, text, size) : nullptr);
}

static void *expat_malloc(size_t size) { return take(memory_of::expat, size); }

static void *expat_realloc(void *block, size_t size)
{
    return take_more(memory_of::expat, block, size);
}

static void expat_free(void *block) { give_back(memory_of::expat, block); }

static void *openssl_malloc(size_t size, const char *, int)
{
    return size == 0 ? nullptr : take(memory_of::openssl, size);
}

static void openssl_free(void *block, const char *, int) { give_back(memory_of::openssl, block); }

static void *openssl_realloc(void *block, size_t size, const char *file, int line)
{
    if (size > 0)
        return take_more(memory_of::openssl, block, size);
    openssl_free(block, file, line);
    return nullptr;
}

} // extern "C"

} // namespace

starved_library::starved_library(memory_of library, size_t allowed, size_t refusals)
    : library_(library)
{
    supply_of(library).left = {allowed, refusals, 0};
}

starved_library::~starved_library() { supply_of(library_).left = {}; }

size_t starved_library::refused() const { return supply_of(library_).left.refused; }

int64_t blocks_held_by(memory_of library) { return supply_of(library).held; }

bool hook_openssl()
{
    return CRYPTO_set_mem_functions(openssl_malloc, openssl_realloc, openssl_free) == 1;
}

hooked_libcurl::hooked_libcurl()
{
    CURLcode code = curl_global_init_mem(CURL_GLOBAL_ALL, libcurl_malloc, libcurl_free,
                                         libcurl_realloc, libcurl_strdup, libcurl_calloc);
    require(code == CURLE_OK, "curl_global_init_mem");
}

hooked_libcurl::~hooked_libcurl() { curl_global_cleanup(); }

} // namespace quillmere_test

using namespace quillmere_test;

extern "C" {

XML_Parser hooked_parser(const XML_Char *encoding) __asm__("__wrap_XML_ParserCreate");

// The linker leads the library's call here: expat's own hooks come with another constructor.
XML_Parser hooked_parser(const XML_Char *encoding)
{
    static const XML_Memory_Handling_Suite hooks = {expat_malloc, expat_realloc, expat_free};
    return XML_ParserCreate_MM(encoding, &hooks, nullptr);
}

} // extern "C"
