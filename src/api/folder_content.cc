// Folder listings, one chunk a call, and the folders of other accounts.
#include "api/api_call.h"
#include "text/number.h"

using namespace quillmere;

// The one path that names a version of the interface.
const char *get_folder_content_uri = "/api/1.0/folder/get_content.php";
const char *attach_foreign_uri = "/api/folder/attach_foreign.php";
const char *detach_foreign_uri = "/api/folder/detach_foreign.php";

namespace {

constexpr int32_t usual_chunk_size = 100;

constexpr const char *chunk_elements[] = {"chunk_size"};

constexpr auto content_reply = index_of(direct_elements, chunk_elements);

// With neither a token nor a key the query starts with "&" and has no "?", deliberately.
void content_query(api_call &call, const char *session_token, const char *folder_key,
                   const char *device_id, const char *chunk, const char *content_type)
{
    if (session_token)
        call.plain("?session_token=", session_token);
    if (folder_key)
        call.plain(session_token ? "&folder_key=" : "?folder_key=", folder_key);
    if (device_id)
        call.plain("&device_id=", device_id);
    if (chunk)
        call.plain("&chunk=", chunk);
    if (content_type)
        call.plain("&content_type=", content_type);
    call.version();
}

// The two operations on foreign folders differ in name alone.
int32_t foreign_folder_call(const char *path, const char *entry_line, const char *url_heading,
                            const char *session_token, const char *folder_key, char **error_message)
{
    api_call call(path, error_message);
    qm_printf("%s", entry_line);
    call.plain("?session_token=", session_token);
    call.plain("&folder_key=", folder_key);
    call.version();

    call.fetch(url_heading, reply_log::text_and_length);
    call.accepted(error_reading::direct);
    return call.status();
}

} // namespace

int32_t get_folder_content(const char *session_token, const char *folder_key, const char *device_id,
                           const char *chunk, const char *content_type, char **error_message,
                           folder_list **folders, int32_t *folder_count, file_list **files,
                           int32_t *file_count, int32_t *chunk_size)
{
    *folders = nullptr;
    *folder_count = 0;
    *files = nullptr;
    *file_count = 0;
    *chunk_size = 0;
    api_call call(get_folder_content_uri, error_message);
    qm_printf("Quillmere API: get_folder_content\n");
    content_query(call, session_token, folder_key, device_id, chunk, content_type);

    folder_content_extraction content;
    call.expect(content_reply, &content);
    call.fetch("get_folder_content url:\n", reply_log::text_and_length);
    if (call.accepted(error_reading::direct)) {
        heap_text size = call.text_of("chunk_size");
        *chunk_size = size ? int32_in(size.get()) : usual_chunk_size;
        *files = file_info_list_new();
        *folders = folder_info_list_new();
        call.extracted(content.extract(call.reply(), call.reply_length(), *folders, folder_count,
                                       *files, file_count));
        qm_printf("get_folder_content Success\n");
    }
    if (*folder_count == 0 || call.malformed()) {
        delete_all_folder_list(folders);
        *folders = nullptr;
    }
    if (*file_count == 0 || call.malformed()) {
        delete_all_file_list(files);
        *files = nullptr;
    }
    return call.status();
}

int32_t attach_foreign_folder(const char *session_token, const char *folder_key,
                              char **error_message)
{
    return foreign_folder_call(attach_foreign_uri, "Quillmere API: attach_foreign\n",
                               "attach_foreign_folder url:\n", session_token, folder_key,
                               error_message);
}

int32_t detach_foreign_folder(const char *session_token, const char *folder_key,
                              char **error_message)
{
    return foreign_folder_call(detach_foreign_uri, "Quillmere API: detach_foreign\n",
                               "detach_foreign_folder url:\n", session_token, folder_key,
                               error_message);
}
