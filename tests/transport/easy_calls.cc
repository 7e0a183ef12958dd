#include "transport/easy_calls.h"

#include <algorithm>
#include <cstdarg>
#include <cstring>
#include <stdexcept>

#undef curl_easy_setopt // macros in some headers
#undef curl_easy_getinfo

namespace quillmere_test {
namespace {

easy_calls *current_easy = nullptr;

bool is_text(CURLoption option)
{
    const CURLoption texts[] = {CURLOPT_URL,           CURLOPT_CAINFO,
                                CURLOPT_PROXY,         CURLOPT_PROXYUSERNAME,
                                CURLOPT_PROXYPASSWORD, CURLOPT_REDIR_PROTOCOLS_STR};
    return std::find(std::begin(texts), std::end(texts), option) != std::end(texts);
}

std::string text_of(const curl_blob &blob)
{
    return std::string(static_cast<const char *>(blob.data), blob.len);
}

void note(CURLoption option, void *value)
{
    easy_option noted = {option, 0, "", nullptr};
    if (option < CURLOPTTYPE_OBJECTPOINT)
        noted.number = reinterpret_cast<intptr_t>(value);
    else if (is_text(option) && value)
        noted.text = static_cast<const char *>(value);
    else if (option == CURLOPT_CAINFO_BLOB)
        noted.text = text_of(*static_cast<const curl_blob *>(value));
    else
        noted.pointer = value;
    current_easy->options.push_back(noted);
    if (option == CURLOPT_ERRORBUFFER) {
        current_easy->error_buffer = static_cast<char *>(value);
        current_easy->error_buffer_texts.push_back(current_easy->error_buffer);
    }
}

} // namespace

const std::vector<CURLoption> memory_options = {CURLOPT_SSL_CTX_DATA, CURLOPT_SSL_CTX_FUNCTION,
                                                CURLOPT_CAINFO_BLOB};

easy_calls::easy_calls() { current_easy = this; }
easy_calls::~easy_calls() { current_easy = nullptr; }

std::vector<CURLoption> easy_calls::names(const std::vector<CURLoption> &without) const
{
    std::vector<CURLoption> result;
    for (const easy_option &each : options)
        if (std::find(without.begin(), without.end(), each.option) == without.end())
            result.push_back(each.option);
    return result;
}

bool easy_calls::has(CURLoption option) const
{
    std::vector<CURLoption> all = names();
    return std::find(all.begin(), all.end(), option) != all.end();
}

const easy_option &easy_calls::last(CURLoption option) const
{
    for (auto each = options.rbegin(); each != options.rend(); ++each)
        if (each->option == option)
            return *each;
    throw std::runtime_error("option " + std::to_string(option) + " was not set");
}

} // namespace quillmere_test

using namespace quillmere_test;

// The linker gives the library's calls to the __wrap_ names and libcurl's functions the __real_
// names.
extern "C" {

CURL *real_init() __asm__("__real_curl_easy_init");
CURLcode real_setopt(CURL *handle, CURLoption option, ...) __asm__("__real_curl_easy_setopt");
CURLcode real_perform(CURL *handle) __asm__("__real_curl_easy_perform");
CURLcode real_getinfo(CURL *handle, CURLINFO info, ...) __asm__("__real_curl_easy_getinfo");
void real_cleanup(CURL *handle) __asm__("__real_curl_easy_cleanup");

CURL *watched_init() __asm__("__wrap_curl_easy_init");
CURLcode watched_setopt(CURL *handle, int number, ...) __asm__("__wrap_curl_easy_setopt");
CURLcode watched_perform(CURL *handle) __asm__("__wrap_curl_easy_perform");
CURLcode watched_getinfo(CURL *handle, int number, ...) __asm__("__wrap_curl_easy_getinfo");
void watched_cleanup(CURL *handle) __asm__("__wrap_curl_easy_cleanup");

CURL *watched_init()
{
    if (current_easy && ++current_easy->inits <= current_easy->failing_inits)
        return nullptr;
    CURL *handle = real_init();
    if (current_easy)
        current_easy->handles.push_back(handle);
    return handle;
}

// Every value that the library passes is as wide as a pointer. The option is taken as an int, as it
// is passed, because va_start must not be given an enumeration, whose width is the compiler's
// choice.
CURLcode watched_setopt(CURL *handle, int number, ...)
{
    va_list arguments;
    va_start(arguments, number);
    void *value = va_arg(arguments, void *);
    va_end(arguments);
    auto option = static_cast<CURLoption>(number);
    if (current_easy && current_easy->refused == option)
        return current_easy->refusal;
    if (current_easy)
        note(option, value);
    if (option == CURLOPT_PORT && current_easy && current_easy->other_port != 0)
        return real_setopt(handle, option, current_easy->other_port);
    return real_setopt(handle, option, value);
}

CURLcode watched_perform(CURL *handle)
{
    if (!current_easy)
        return real_perform(handle);
    ++current_easy->performances;
    return current_easy->perform ? current_easy->perform(current_easy->performances)
                                 : real_perform(handle);
}

// What receives the answer is a pointer, whatever the question.
CURLcode watched_getinfo(CURL *handle, int number, ...)
{
    va_list arguments;
    va_start(arguments, number);
    void *answer = va_arg(arguments, void *);
    va_end(arguments);
    auto info = static_cast<CURLINFO>(number);
    if (current_easy && current_easy->refused_info == info)
        return CURLE_UNKNOWN_OPTION;
    if (current_easy && current_easy->told.count(info) > 0) {
        *static_cast<long *>(answer) = current_easy->told[info];
        return CURLE_OK;
    }
    return real_getinfo(handle, info, answer);
}

void watched_cleanup(CURL *handle)
{
    if (current_easy)
        ++current_easy->cleanups;
    real_cleanup(handle);
}

} // extern "C"
