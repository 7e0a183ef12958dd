#include "calls.h"

#include <cstdio>
#include <cstdlib>

#include "quillmere.h"

namespace quillmere_bench {
namespace {

void require_success(int32_t status, const char *operation)
{
    if (status == QM_OK)
        return;
    std::fprintf(stderr, "%s ended with status %d\n", operation, static_cast<int>(status));
    std::exit(1);
}

} // namespace

void call_folder_info()
{
    char *message = nullptr;
    folder_info *info = nullptr;
    require_success(get_folder_info("token", "folder", nullptr, nullptr, &message, &info),
                    "get_folder_info");
    folder_info_delete(&info);
    std::free(message);
}

void call_user_info()
{
    char *message = nullptr;
    user_info *info = nullptr;
    require_success(get_user_info("token", &info, &message), "get_user_info");
    user_info_delete(&info);
    std::free(message);
}

file_list *listed_files()
{
    char *message = nullptr;
    folder_list *folders = nullptr;
    file_list *files = nullptr;
    int32_t folder_count = 0;
    int32_t file_count = 0;
    int32_t chunk_size = 0;
    require_success(get_folder_content("token", "folder", nullptr, "1", "files", &message, &folders,
                                       &folder_count, &files, &file_count, &chunk_size),
                    "get_folder_content");
    if (folders)
        delete_all_folder_list(&folders);
    std::free(message);
    return files;
}

void call_folder_content()
{
    file_list *files = listed_files();
    if (files)
        delete_all_file_list(&files);
}

void call_device_changes()
{
    char *message = nullptr;
    change_list *changes = nullptr;
    uint64_t revision = 0;
    uint32_t count = 0;
    int32_t block = 0;
    require_success(
        get_device_changes("token", 0, 0, &revision, &changes, &count, &block, &message),
        "get_device_changes");
    if (changes)
        delete_all_change_list(&changes);
    std::free(message);
}

} // namespace quillmere_bench
