#include "api/account_calls.h"

#include "api/taken_results.h"

namespace quillmere_test {

std::ostream &operator<<(std::ostream &stream, const call_outcome &outcome)
{
    return stream << "status " << outcome.status << ", message " << outcome.message.value_or("NULL")
                  << ", " << outcome.results;
}

call_outcome user_info_call(const char *token)
{
    auto *info = rubbish<user_info>();
    char *message = rubbish<char>();
    int32_t status = get_user_info(token, &info, &message);
    return outcome_of(status, message, taken_record(info));
}

call_outcome user_limits_call(const char *token)
{
    auto *limits = rubbish<user_limits>();
    char *message = rubbish<char>();
    int32_t status = get_user_limits(token, &limits, &message);
    return outcome_of(status, message, taken_record(limits));
}

call_outcome myfiles_revision_call(const char *token)
{
    char *revision = rubbish<char>();
    char *epoch = rubbish<char>();
    char *message = rubbish<char>();
    int32_t status = get_myfiles_revision(token, &revision, &epoch, &message);
    return outcome_of(status, message, taken("revision", revision) + " " + taken("epoch", epoch));
}

call_outcome folder_info_call(const char *token, const char *folder_key, const char *device_id,
                              const char *details)
{
    auto *info = rubbish<folder_info>();
    char *message = rubbish<char>();
    int32_t status = get_folder_info(token, folder_key, device_id, details, &message, &info);
    return outcome_of(status, message, taken_record(info));
}

call_outcome create_folder_call(const char *token, const char *name, const char *parent_key,
                                const char *mtime)
{
    char *key = rubbish<char>();
    char *message = rubbish<char>();
    int32_t status = create_folder(token, name, parent_key, mtime, &key, &message);
    return outcome_of(status, message, taken("key", key));
}

call_outcome delete_folder_call(const char *token, const char *folder_key)
{
    char *message = rubbish<char>();
    int32_t status = delete_folder(token, folder_key, &message);
    return outcome_of(status, message, "");
}

call_outcome update_folder_call(const char *token, const char *folder_key, const char *name,
                                const char *description, const char *tags, int32_t privacy,
                                int32_t recursive, const char *mtime)
{
    char *message = rubbish<char>();
    int32_t status = update_folder(token, folder_key, name, description, tags, privacy, recursive,
                                   mtime, &message);
    return outcome_of(status, message, "");
}

call_outcome copy_folder_call(const char *token, const char *source, const char *destination)
{
    char *key = rubbish<char>();
    char *message = rubbish<char>();
    int32_t status = copy_folder(token, source, destination, &key, &message);
    return outcome_of(status, message, taken("key", key));
}

call_outcome move_folder_call(const char *token, const char *source, const char *destination)
{
    char *message = rubbish<char>();
    int32_t status = move_folder(token, source, destination, &message);
    return outcome_of(status, message, "");
}

call_outcome folder_content_call(const char *token, const char *folder_key, const char *device_id,
                                 const char *chunk, const char *content_type)
{
    char *message = rubbish<char>();
    auto *folders = rubbish<folder_list>();
    auto *files = rubbish<file_list>();
    int32_t folder_count = rubbish_number;
    int32_t file_count = rubbish_number;
    int32_t chunk_size = rubbish_number;
    int32_t status = get_folder_content(token, folder_key, device_id, chunk, content_type, &message,
                                        &folders, &folder_count, &files, &file_count, &chunk_size);
    return outcome_of(status, message,
                      taken_number("folders", folder_count) + " " +
                          taken_number("files", file_count) + " " +
                          taken_number("chunk", chunk_size) + " " +
                          taken_list<delete_all_folder_list>("folders", folders) + " " +
                          taken_list<delete_all_file_list>("files", files));
}

call_outcome attach_foreign_call(const char *token, const char *folder_key)
{
    char *message = rubbish<char>();
    int32_t status = attach_foreign_folder(token, folder_key, &message);
    return outcome_of(status, message, "");
}

call_outcome detach_foreign_call(const char *token, const char *folder_key)
{
    char *message = rubbish<char>();
    int32_t status = detach_foreign_folder(token, folder_key, &message);
    return outcome_of(status, message, "");
}

call_outcome file_info_call(const char *quick_key, const char *token)
{
    char *message = rubbish<char>();
    auto *info = rubbish<file_info>();
    int32_t status = get_file_info(quick_key, token, &message, &info);
    return outcome_of(status, message, taken_record(info));
}

call_outcome create_file_call(const char *token, const char *name, const char *extension,
                              const char *parent_key, const char *mtime)
{
    char *key = rubbish<char>();
    char *message = rubbish<char>();
    int32_t status = create_file(token, name, extension, parent_key, mtime, &key, &message);
    return outcome_of(status, message, taken("key", key));
}

call_outcome delete_file_call(const char *token, const char *quick_key)
{
    char *message = rubbish<char>();
    int32_t status = delete_file(token, quick_key, &message);
    return outcome_of(status, message, "");
}

call_outcome copy_file_call(const char *token, const char *quick_key, const char *folder_key)
{
    char *key = rubbish<char>();
    char *message = rubbish<char>();
    int32_t status = copy_file(token, quick_key, folder_key, &key, &message);
    return outcome_of(status, message, taken("key", key));
}

call_outcome move_file_call(const char *token, const char *quick_key, const char *folder_key)
{
    char *message = rubbish<char>();
    int32_t status = move_file(token, quick_key, folder_key, &message);
    return outcome_of(status, message, "");
}

call_outcome links_call(const char *quick_key, const char *link_type, const char *token)
{
    auto *links = rubbish<file_links_list>();
    int32_t count = rubbish_number;
    char *message = rubbish<char>();
    int32_t status = get_links(quick_key, link_type, token, &links, &count, &message);
    return outcome_of(status, message,
                      taken_number("count", count) + " " +
                          taken_list<delete_all_file_links_list>("links", links));
}

call_outcome download_link_call(const char *token, const char *quick_key)
{
    char *url = rubbish<char>();
    int32_t bandwidth = rubbish_number;
    char *message = rubbish<char>();
    int32_t error = rubbish_number;
    char *error_text = rubbish<char>();
    int32_t status =
        get_download_link(token, quick_key, &url, &bandwidth, &message, &error, &error_text);
    return outcome_of(status, message,
                      taken("url", url) + " " + taken_number("bandwidth", bandwidth) + " " +
                          taken_number("error", error) + " " + taken("text", error_text));
}

namespace {

using changes_operation = int32_t (*)(const char *, uint64_t, uint32_t, uint64_t *, change_list **,
                                      uint32_t *, int32_t *, char **);

call_outcome changes_call(changes_operation operation, const char *token, uint64_t revision,
                          uint32_t device_id)
{
    auto now = static_cast<uint64_t>(rubbish_number);
    auto *changes = rubbish<change_list>();
    auto count = static_cast<uint32_t>(rubbish_number);
    int32_t block_size = rubbish_number;
    char *message = rubbish<char>();
    int32_t status =
        operation(token, revision, device_id, &now, &changes, &count, &block_size, &message);
    return outcome_of(status, message,
                      taken_number("revision", now) + " " + taken_number("count", count) + " " +
                          taken_number("block", block_size) + " " + taken_changes(status, changes));
}

} // namespace

call_outcome device_changes_call(const char *token, uint64_t revision, uint32_t device_id)
{
    return changes_call(get_device_changes, token, revision, device_id);
}

call_outcome sample_changes_call(const char *token, uint64_t revision, uint32_t device_id)
{
    return changes_call(test_get_device_changes, token, revision, device_id);
}

} // namespace quillmere_test
