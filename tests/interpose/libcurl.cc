#include "interpose/libcurl.h"

#include <cstdarg>

#undef curl_share_setopt // a macro that checks the number of arguments

namespace quillmere_test {
namespace {

pretended_libcurl *current = nullptr;

void note(const char *call)
{
    if (current)
        current->calls.emplace_back(call);
}

} // namespace

pretended_libcurl::pretended_libcurl() { current = this; }
pretended_libcurl::~pretended_libcurl() { current = nullptr; }

} // namespace quillmere_test

using namespace quillmere_test;

extern "C" {

CURLcode real_global_init(long flags) __asm__("__real_curl_global_init");
void real_global_cleanup() __asm__("__real_curl_global_cleanup");
curl_version_info_data *real_version_info(CURLversion age) __asm__("__real_curl_version_info");
CURLSH *real_share_init() __asm__("__real_curl_share_init");
CURLSHcode real_share_cleanup(CURLSH *handle) __asm__("__real_curl_share_cleanup");
CURLSHcode real_share_setopt(CURLSH *handle, CURLSHoption option,
                             ...) __asm__("__real_curl_share_setopt");

CURLcode noted_global_init(long flags) __asm__("__wrap_curl_global_init");
void noted_global_cleanup() __asm__("__wrap_curl_global_cleanup");
curl_version_info_data *pretended_version_info(CURLversion age) __asm__("__wrap_curl_version_info");
CURLSH *pretended_share_init() __asm__("__wrap_curl_share_init");
CURLSHcode noted_share_cleanup(CURLSH *handle) __asm__("__wrap_curl_share_cleanup");
// The option is an int here, as va_start() wants its neighbour to be.
CURLSHcode pretended_share_setopt(CURLSH *handle, int number,
                                  ...) __asm__("__wrap_curl_share_setopt");

CURLcode noted_global_init(long flags)
{
    note("curl_global_init");
    if (current)
        current->global_flags = flags;
    return real_global_init(flags);
}

void noted_global_cleanup()
{
    note("curl_global_cleanup");
    real_global_cleanup();
}

curl_version_info_data *pretended_version_info(CURLversion age)
{
    note("curl_version_info");
    curl_version_info_data *info = real_version_info(age);
    if (!current)
        return info;
    current->asked_age = age;
    if (!current->ssl_version)
        return info;
    static curl_version_info_data pretended;
    pretended = *info;
    pretended.ssl_version = current->ssl_version;
    return &pretended;
}

CURLSH *pretended_share_init()
{
    note("curl_share_init");
    if (current && !current->makes_share_handles)
        return nullptr;
    CURLSH *handle = real_share_init();
    if (current)
        current->handles.push_back(handle);
    return handle;
}

CURLSHcode noted_share_cleanup(CURLSH *handle)
{
    if (current)
        current->released.push_back(handle);
    return real_share_cleanup(handle);
}

CURLSHcode pretended_share_setopt(CURLSH *handle, int number, ...)
{
    auto option = static_cast<CURLSHoption>(number);
    va_list arguments;
    va_start(arguments, number);
    int kind = -1;
    void *callback = nullptr;
    if (option == CURLSHOPT_SHARE)
        kind = va_arg(arguments, int);
    else
        callback = va_arg(arguments, void *);
    va_end(arguments);

    if (current && current->refused_option == option)
        return current->refusal;
    if (current)
        current->options.push_back({option, kind});
    return option == CURLSHOPT_SHARE ? real_share_setopt(handle, option, kind)
                                     : real_share_setopt(handle, option, callback);
}

} // extern "C"
