#include "demanded.h"

#include <cstring>
#include <utility>

namespace quillmere_bench {
namespace {

// For each field of a record the same argument.
template <size_t... fields, class Make> auto with_text(Make make, std::index_sequence<fields...>)
{
    return make(((void)fields, "a value of its own")...);
}

// As the replies of the measurements have it.
file_info *new_file()
{
    return file_info_new("k4x9w2m7q000123", nullptr, "pictures of the summer, 000123.jpeg",
                         "2026-01-01 00:00:00", "0", "taken from the boat, at noon",
                         "summer,boat,2026", "4096", "private", "image", "image/jpeg",
                         "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855",
                         nullptr, "no", "000123", "Ada Lovelace", "1", "0", "4");
}

file_info *copy_of(const file_info *file)
{
    return file_info_new(
        file_info_get_quickkey(file), file_info_get_parent_folderkey(file),
        file_info_get_filename(file), file_info_get_created(file), file_info_get_downloads(file),
        file_info_get_desc(file), file_info_get_tags(file), file_info_get_size(file),
        file_info_get_privacy(file), file_info_get_type(file), file_info_get_mimetype(file),
        file_info_get_hash(file), file_info_get_delete_date(file),
        file_info_get_password_protected(file), file_info_get_revision(file),
        file_info_get_owner_name(file), file_info_get_flag(file),
        file_info_get_shared_by_user(file), file_info_get_permissions(file));
}

} // namespace

void make_folder_record()
{
    folder_info *info = with_text(folder_info_new, std::make_index_sequence<24>());
    folder_info_delete(&info);
}

void make_user_record()
{
    user_info *info = with_text(user_info_new, std::make_index_sequence<39>());
    user_info_delete(&info);
}

void make_listing()
{
    file_list *files = file_info_list_new();
    for (int number = 0; number < 1000; ++number)
        add_to_file_list(files, new_file());
    delete_all_file_list(&files);
}

void make_change_list()
{
    change_list *changes = change_list_new();
    for (int number = 0; number < 500; ++number)
        add_to_change_list(changes, change_info_new("k123", "folder", "2026-01-01 00:00:00", 123, 0,
                                                    1, "file 123.txt", "text/plain", "text/plain"));
    delete_all_change_list(&changes);
}

void log_lines(const char *reply)
{
    qm_printf("\nget_folder_info url text:\n%s\n",
              "https://127.0.0.1:65535/api/folder/get_info.php?session_token=token&"
              "folder_key=folder&details=yes&version=2.15");
    qm_printf("Got text:\n%s\n", reply);
    qm_printf("Text len: %lu\n", static_cast<unsigned long>(std::strlen(reply)));
}

file_list *copy_of(const file_list *files)
{
    file_list *copies = file_info_list_new();
    for (const file_list *node = files; node; node = node->next)
        if (node->record)
            add_to_file_list(copies, copy_of(node->record));
    return copies;
}

} // namespace quillmere_bench
