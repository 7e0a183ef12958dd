// Reading and changing one folder.
#include "api/api_call.h"

using namespace quillmere;

const char *get_folder_info_uri = "/api/folder/get_info.php";
const char *create_folder_uri = "/api/folder/create.php";
const char *delete_folder_uri = "/api/folder/delete.php";
const char *update_folder_uri = "/api/folder/update.php";
const char *copy_folder_uri = "/api/folder/copy.php";
const char *move_folder_uri = "/api/folder/move.php";

namespace {

constexpr element_field<folder_info> folder_elements[] = {
    {"/folder_info/folderkey", &folder_info::folderkey},
    {"/folder_info/name", &folder_info::foldername},
    {"/folder_info/created", &folder_info::created},
    {"/folder_info/description", &folder_info::desc},
    {"/folder_info/tags", &folder_info::tags},
    {"/folder_info/folder_count", &folder_info::foldercount},
    {"/folder_info/file_count", &folder_info::filecount},
    {"/folder_info/total_files", &folder_info::total_files},
    {"/folder_info/total_folders", &folder_info::total_folders},
    {"/folder_info/total_size", &folder_info::total_size},
    {"/folder_info/revision", &folder_info::revision},
    {"/folder_info/epoch", &folder_info::epoch},
    {"/folder_info/shared", &folder_info::shared},
    {"/folder_info/owner_name", &folder_info::owner_name},
    {"/folder_info/parent_folderkey", &folder_info::parent_folderkey},
    {"/folder_info/delete_date", &folder_info::delete_date},
    {"/folder_info/custom_url", &folder_info::custom_url},
    {"/folder_info/dropbox_enabled", &folder_info::dbx_enabled},
    {"/folder_info/flag", &folder_info::flag},
    {"/folder_info/shared_by_user", &folder_info::shared_by_user},
    {"/folder_info/permissions", &folder_info::permissions},
    {"/folder_info/avatar", &folder_info::avatar},
    {"/folder_info/privacy", &folder_info::privacy},
    {"/folder_info/byte_count", &folder_info::byte_count},
};

constexpr const char *created_elements[] = {"folder_key"};
constexpr const char *copied_elements[] = {"new_folderkey"};

constexpr auto folder_reply = index_of(direct_elements, folder_elements);
constexpr auto created_reply = index_of(standard_elements, created_elements);
constexpr auto copied_reply = index_of(direct_elements, copied_elements);

// What update_folder() takes for a privacy; anything else leaves the folder's as it is.
constexpr int32_t make_public = -1;
constexpr int32_t make_private = 1;

// This endpoint's way of writing a query: each parameter is followed by its "&".
void led_parameter(api_call &call, const char *key, const char *value)
{
    if (!value)
        return;
    call.plain(key, value);
    call.text("&");
}

void privacy_pair(api_call &call, int32_t privacy, int32_t recursive)
{
    if (privacy != make_public && privacy != make_private)
        return;
    call.plain("&privacy=", privacy == make_public ? "public" : "private");
    call.plain("&privacy_recursive=", recursive ? "yes" : "no");
}

} // namespace

int32_t get_folder_info(const char *session_token, const char *folder_key, const char *device_id,
                        const char *details, char **error_message, folder_info **info)
{
    *info = nullptr;
    api_call call(get_folder_info_uri, error_message);
    call.text("?");
    led_parameter(call, "session_token=", session_token);
    led_parameter(call, "device_id=", device_id);
    led_parameter(call, "folder_key=", folder_key);
    led_parameter(call, "details=", given(details) ? details : "yes");
    call.plain("version=", api_version);

    call.expect(folder_reply);
    call.fetch("\nget_folder_info url text:\n", reply_log::text_and_length);
    if (call.accepted(error_reading::direct))
        *info = call.record_of(folder_elements).release();
    return call.status();
}

int32_t create_folder(const char *session_token, const char *name, const char *parent_key,
                      const char *mtime, char **folder_key, char **error_message)
{
    *folder_key = nullptr;
    api_call call(create_folder_uri, error_message);
    call.plain("?session_token=", session_token);
    call.encoded("&foldername=", name);
    if (given(parent_key))
        call.encoded("&parent_key=", parent_key);
    if (given(mtime))
        call.encoded("&mtime=", mtime);
    call.text("&allow_duplicate_name=no");
    call.version();

    call.expect(created_reply);
    call.fetch("create_folder: url: ", reply_log::response);
    if (call.accepted())
        *folder_key = call.text_of("folder_key").release();
    if (call.malformed())
        discard(folder_key);
    return call.status();
}

int32_t delete_folder(const char *session_token, const char *folder_key, char **error_message)
{
    api_call call(delete_folder_uri, error_message);
    call.plain("?session_token=", session_token);
    call.encoded("&folder_key=", folder_key);
    call.version();

    call.fetch("delete_folder url: ", reply_log::text);
    call.accepted();
    return call.status();
}

int32_t update_folder(const char *session_token, const char *folder_key, const char *name,
                      const char *description, const char *tags, int32_t privacy,
                      int32_t privacy_recursive, const char *mtime, char **error_message)
{
    api_call call(update_folder_uri, error_message);
    call.plain("?session_token=", session_token);
    call.encoded("&folder_key=", folder_key);
    call.version(); // ahead of the optional parameters, deliberately
    if (given(name))
        call.encoded("&foldername=", name);
    if (description)
        call.encoded("&description=", description);
    if (tags)
        call.encoded("&tags=", tags);
    privacy_pair(call, privacy, privacy_recursive);
    if (given(mtime))
        call.encoded("&mtime=", mtime);

    call.fetch("update folder url: ", reply_log::text);
    call.accepted();
    return call.status();
}

int32_t copy_folder(const char *session_token, const char *source_key, const char *destination_key,
                    char **new_folder_key, char **error_message)
{
    *new_folder_key = nullptr;
    api_call call(copy_folder_uri, error_message);
    qm_printf("Quillmere API: copy_folder\n");
    call.plain("?session_token=", session_token);
    call.plain("&folder_key_src=", source_key);
    if (destination_key)
        call.plain("&folder_key_dst=", destination_key);
    call.version();

    call.expect(copied_reply);
    call.fetch("copy_folder url:\n", reply_log::text_and_length);
    if (call.accepted(error_reading::direct))
        *new_folder_key = call.text_of("new_folderkey").release();
    if (call.malformed())
        discard(new_folder_key);
    return call.status();
}

int32_t move_folder(const char *session_token, const char *source_key, const char *destination_key,
                    char **error_message)
{
    api_call call(move_folder_uri, error_message);
    qm_printf("Quillmere API: move_folder\n");
    call.plain("?session_token=", session_token);
    call.plain("&folder_key_src=", source_key);
    if (destination_key)
        call.plain("&folder_key_dst=", destination_key);
    call.version();

    call.fetch("move_folder url:\n", reply_log::text_and_length);
    call.accepted(error_reading::direct);
    return call.status();
}
