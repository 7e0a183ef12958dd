// The links of a file. Both operations ask the same endpoint, each through a path of its own.
#include "api/api_call.h"
#include "text/number.h"

using namespace quillmere;

const char *get_links_uri = "/api/file/get_links.php";
const char *get_download_link_uri = "/api/file/get_links.php";

namespace {

constexpr const char *download_elements[] = {
    "direct_download",
    "direct_download_free_bandwidth",
    "direct_download_error",
    "direct_download_error_message",
};

constexpr auto links_reply = index_of(standard_elements);
constexpr auto download_reply = index_of(standard_elements, download_elements);

} // namespace

int32_t get_links(const char *quick_key, const char *link_type, const char *session_token,
                  file_links_list **links, int32_t *link_count, char **error_message)
{
    *links = nullptr;
    *link_count = 0;
    api_call call(get_links_uri, error_message);
    call.encoded("?quick_key=", quick_key);
    if (given(link_type))
        call.plain("&link_type=", link_type);
    if (given(session_token))
        call.plain("&session_token=", session_token);
    call.version();

    links_extraction found;
    call.expect(links_reply, &found);
    call.fetch("get_links url: ", reply_log::text);
    if (call.accepted()) {
        *links = file_links_list_new();
        call.extracted(found.extract(call.reply(), call.reply_length(), *links, link_count));
        qm_printf("get_links Success\n");
    }
    if (*link_count == 0 || call.malformed()) {
        delete_all_file_links_list(links);
        *links = nullptr;
    }
    return call.status();
}

int32_t get_download_link(const char *session_token, const char *quick_key, char **download_url,
                          int32_t *free_bandwidth, char **error_message, int32_t *download_error,
                          char **download_error_message)
{
    *download_url = nullptr;
    *free_bandwidth = 0;
    *download_error = 0;
    *download_error_message = nullptr;
    api_call call(get_download_link_uri, error_message);
    call.plain("?session_token=", session_token);
    call.plain("&quick_key=", quick_key); // not encoded, deliberately unlike in get_links()
    call.text("&link_type=direct_download");
    call.version();

    call.expect(download_reply);
    call.fetch("get_download_link url: ", reply_log::text);
    if (call.accepted()) {
        *download_url = normalize_url(call.text_of("direct_download").get(), "http");
        if (heap_text bandwidth = call.text_of("direct_download_free_bandwidth"))
            *free_bandwidth = int32_in(bandwidth.get());
        if (heap_text error = call.text_of("direct_download_error")) {
            *download_error = int32_in(error.get());
            *download_error_message = call.text_of("direct_download_error_message").release();
        }
    }
    if (call.malformed()) {
        discard(download_url);
        discard(download_error_message);
    }
    return call.status();
}
