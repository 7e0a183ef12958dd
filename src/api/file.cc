// Reading and changing one file.
#include "api/api_call.h"

using namespace quillmere;

const char *get_file_info_uri = "/api/file/get_info.php";
const char *create_file_uri = "/api/file/create.php";
const char *delete_file_uri = "/api/file/delete.php";
const char *copy_file_uri = "/api/file/copy.php";
const char *move_file_uri = "/api/file/move.php";

namespace {

constexpr element_field<file_info> file_elements[] = {
    {"/file_info/quickkey", &file_info::quickkey},
    {"/file_info/parent_folderkey", &file_info::parent_folderkey},
    {"/file_info/filename", &file_info::filename},
    {"/file_info/created", &file_info::created},
    {"/file_info/downloads", &file_info::downloads},
    {"/file_info/description", &file_info::desc},
    {"/file_info/tags", &file_info::tags},
    {"/file_info/size", &file_info::size},
    {"/file_info/privacy", &file_info::privacy},
    {"/file_info/filetype", &file_info::type},
    {"/file_info/mimetype", &file_info::mimetype},
    {"/file_info/hash", &file_info::hash},
    {"/file_info/delete_date", &file_info::delete_date},
    {"/file_info/password_protected", &file_info::password_protected},
    {"/file_info/revision", &file_info::revision},
    {"/file_info/owner_name", &file_info::owner_name},
    {"/file_info/flag", &file_info::flag},
    {"/file_info/shared_by_user", &file_info::shared_by_user},
    {"/file_info/permissions", &file_info::permissions},
};

constexpr const char *created_elements[] = {"quickkey"};
constexpr const char *copied_elements[] = {"new_quickkey"};

constexpr auto file_reply = index_of(standard_elements, file_elements);
constexpr auto created_reply = index_of(standard_elements, created_elements);
constexpr auto copied_reply = index_of(standard_elements, copied_elements);

} // namespace

int32_t get_file_info(const char *quick_key, const char *session_token, char **error_message,
                      file_info **info)
{
    *info = nullptr;
    api_call call(get_file_info_uri, error_message);
    call.plain("?quick_key=", quick_key);
    if (session_token)
        call.plain("&session_token=", session_token);
    call.version();

    call.expect(file_reply);
    call.fetch("\nget_file_info url text:\n", reply_log::text_and_length);
    if (call.accepted())
        *info = call.record_of(file_elements).release();
    return call.status();
}

int32_t create_file(const char *session_token, const char *filename, const char *file_extension,
                    const char *parent_key, const char *mtime, char **quick_key,
                    char **error_message)
{
    *quick_key = nullptr;
    api_call call(create_file_uri, error_message);
    call.plain("?session_token=", session_token);
    if (filename)
        call.encoded("&filename=", filename);
    if (file_extension)
        call.encoded("&file_extension=", file_extension);
    if (parent_key)
        call.encoded("&parent_key=", parent_key);
    if (given(mtime))
        call.encoded("&mtime=", mtime);
    call.version();

    call.expect(created_reply);
    call.fetch("create_file: url: ", reply_log::response);
    if (call.accepted())
        *quick_key = call.text_of("quickkey").release();
    if (call.malformed())
        discard(quick_key);
    return call.status();
}

int32_t delete_file(const char *session_token, const char *quick_key, char **error_message)
{
    api_call call(delete_file_uri, error_message);
    call.plain("?session_token=", session_token);
    call.plain("&quick_key=", quick_key);
    call.version();

    call.fetch("delete_file: url: ", reply_log::response);
    call.accepted();
    return call.status();
}

int32_t copy_file(const char *session_token, const char *quick_key, const char *folder_key,
                  char **new_quick_key, char **error_message)
{
    *new_quick_key = nullptr;
    api_call call(copy_file_uri, error_message);
    call.plain("?session_token=", session_token);
    call.plain("&quick_key=", quick_key);
    if (folder_key)
        call.encoded("&folder_key=", folder_key);
    call.version();

    call.expect(copied_reply);
    call.fetch("copy_file: url: ", reply_log::response);
    if (call.accepted())
        *new_quick_key = call.text_of("new_quickkey").release();
    if (call.malformed())
        discard(new_quick_key);
    return call.status();
}

int32_t move_file(const char *session_token, const char *quick_key, const char *folder_key,
                  char **error_message)
{
    api_call call(move_file_uri, error_message);
    call.plain("?session_token=", session_token);
    call.plain("&quick_key=", quick_key);
    if (folder_key)
        call.encoded("&folder_key=", folder_key);
    call.version();

    call.fetch("move_file: url: ", reply_log::response);
    call.accepted();
    return call.status();
}
