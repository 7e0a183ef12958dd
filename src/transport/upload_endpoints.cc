// What surrounds an upload: the addresses it goes to, the reply it comes back with, and the change
// of a file's metadata.
#include <cstring>

#include "owned.h"
#include "text/number.h"

using namespace quillmere;

const char *update_file_uri = "/api/file/update.php";

namespace {

// The configured upload addresses already carry a query, so every parameter starts with "&". Values
// are not encoded: tokens and keys are the service's own, and hashes are hexadecimal.
owned_buffer upload_url(const char *session_token, int32_t use_tls)
{
    owned_buffer url(string_new(256));
    string_append(url.get(), use_tls ? urls[3] : urls[2]);
    string_append(url.get(), "&session_token=");
    string_append(url.get(), session_token);
    return url;
}

// What follows the reply's headers, or the whole reply if it has none. A separator that ends with
// the reply is deliberately not looked for: there would be no body behind it. A copy, since a
// damaged body is logged, and the bytes received need not end in a NUL.
owned_buffer body_of(const char *reply, uint64_t length)
{
    static const char separator[] = "\r\n\r\n";
    constexpr uint64_t separator_length = sizeof separator - 1;
    const char *start = reply;
    if (const void *found = memmem(reply, length - 1, separator, separator_length))
        start = static_cast<const char *>(found) + separator_length;
    owned_buffer body(string_new(0));
    string_append_len(body.get(), start, length - static_cast<uint64_t>(start - reply));
    return body;
}

heap_text value_in(const string_buffer &body, const char *sought, int32_t *parse_failed)
{
    return heap_text(simple_get_xml_node_value(body.bytes, body.length, sought, parse_failed));
}

bool starts_with_zero(const heap_text &text) { return text && *text == '0'; }

using owned_request = std::unique_ptr<api_request, void (*)(api_request *)>;

} // namespace

char *get_upload_url(const char *session_token, const char *upload_key, int32_t use_tls)
{
    if (!session_token)
        return nullptr;
    owned_buffer url = upload_url(session_token, use_tls);
    if (upload_key) {
        string_append(url.get(), "&uploadkey=");
        string_append(url.get(), upload_key);
    }
    return string_dup(string_get(url.get()));
}

char *get_patch_upload_url(const char *session_token, const char *quick_key, uint64_t revision,
                           const char *target_hash, uint64_t target_size, int32_t use_tls)
{
    if (!session_token)
        return nullptr;
    owned_buffer url = upload_url(session_token, use_tls);
    string_append(url.get(), "&quickkey="); // without an underscore, deliberately
    string_append(url.get(), quick_key);
    string_append(url.get(), "&revision=");
    string_append_num(url.get(), revision);
    string_append(url.get(), "&target_hash=");
    string_append(url.get(), target_hash);
    string_append(url.get(), "&target_size=");
    string_append_num(url.get(), target_size);
    return string_dup(string_get(url.get()));
}

int32_t parse_upload_response(const char *reply, uint64_t length, char **upload_key)
{
    *upload_key = nullptr;
    if (!reply || length < 4)
        return -1;

    owned_buffer body = body_of(reply, length);
    int32_t result_damaged = 0;
    int32_t key_damaged = 0;
    heap_text result = value_in(*body, "result", &result_damaged);
    heap_text key = value_in(*body, "key", &key_damaged);
    if (result_damaged || key_damaged)
        return QM_MALFORMED_REPLY;

    *upload_key = key.release(); // of a refused upload too
    return starts_with_zero(result) ? int32_in(result.get()) : -1;
}

int32_t update_file(const char *session_token, const char *quick_key, const char *filename,
                    const char *description, const char *tags, const char *privacy,
                    const char *mtime, char **message)
{
    *message = nullptr;
    owned_request request(api_request_new(), [](api_request *made) { api_request_delete(&made); });
    // On the plain base address, deliberately, and unlike every other operation.
    string_buffer *url = request->url = api_url_new_http(update_file_uri);
    url_add_required_parameter(url, "session_token", session_token);
    url_add_required_parameter(url, "quick_key", quick_key);
    url_add_optional_parameter_null_or_empty(url, "filename", filename);
    url_add_optional_parameter_null(url, "description", description);
    url_add_optional_parameter_null(url, "tags", tags);
    url_add_optional_parameter_null_or_empty(url, "privacy", privacy);
    url_add_optional_parameter_null_or_empty(url, "mtime", mtime);
    url_add_required_parameter(url, "version", api_version);
    return make_api_call(request.get(), message);
}
