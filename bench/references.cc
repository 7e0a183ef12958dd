#include "references.h"

#include <expat.h>

#include <cstdio>
#include <cstdlib>

namespace quillmere_bench {
namespace {

size_t discard(char *, size_t size, size_t count, void *) { return size * count; }

} // namespace

void parse_once(const char *reply, size_t length)
{
    XML_Parser parser = XML_ParserCreate("UTF-8");
    XML_SetElementHandler(
        parser, [](void *, const char *, const char **) {}, [](void *, const char *) {});
    XML_SetCharacterDataHandler(parser, [](void *, const char *, int) {});
    if (XML_Parse(parser, reply, static_cast<int>(length), XML_TRUE) != XML_STATUS_OK) {
        std::fprintf(stderr, "a reply of this measurement is no XML\n");
        std::exit(1);
    }
    XML_ParserFree(parser);
}

void set_options(CURL *handle, const std::string &url, const std::string &ca_path)
{
    curl_easy_setopt(handle, CURLOPT_URL, url.c_str());
    curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L);
    curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(handle, CURLOPT_TIMEOUT, 60L);
    curl_easy_setopt(handle, CURLOPT_NOPROGRESS, 1L);
    curl_easy_setopt(handle, CURLOPT_CAINFO, ca_path.c_str());
    curl_easy_setopt(handle, CURLOPT_SSL_VERIFYPEER, 1L);
    curl_easy_setopt(handle, CURLOPT_SSL_VERIFYHOST, 2L);
    curl_easy_setopt(handle, CURLOPT_WRITEFUNCTION, discard);
}

raw_handle new_raw_handle(const std::string &url, const std::string &ca_path)
{
    raw_handle handle(curl_easy_init());
    set_options(handle.get(), url, ca_path);
    return handle;
}

void perform(CURL *handle)
{
    CURLcode code = curl_easy_perform(handle);
    if (code == CURLE_OK)
        return;
    std::fprintf(stderr, "a transfer has failed: %s\n", curl_easy_strerror(code));
    std::exit(1);
}

void raw_exchange(const std::string &url, const std::string &ca_path)
{
    perform(new_raw_handle(url, ca_path).get());
}

void unverified_exchange(const std::string &url)
{
    raw_handle handle = new_raw_handle(url, "");
    curl_easy_setopt(handle.get(), CURLOPT_CAINFO, nullptr);
    curl_easy_setopt(handle.get(), CURLOPT_SSL_VERIFYPEER, 0L);
    perform(handle.get());
}

} // namespace quillmere_bench
