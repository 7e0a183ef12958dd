#include "journey/account_client.h"

#include <stdexcept>

#include <gtest/gtest.h>

namespace quillmere_test {

namespace {

using given_texts = std::map<std::string, std::string>;

int32_t privacy(const char *text)
{
    const std::string wanted = text_of(text);
    return wanted.empty() ? 0 : wanted == "public" ? -1 : 1;
}

int32_t call(const std::string &action, const char *session, const given_texts &given,
             char **folder, char **file, char **message)
{
    const auto text = [&given](const char *name) -> const char * {
        const auto found = given.find(name);
        return found == given.end() ? nullptr : found->second.c_str();
    };
    if (action == "folder/create")
        return create_folder(session, text("foldername"), text("parent_key"), nullptr, folder,
                             message);
    if (action == "folder/update")
        return update_folder(session, text("folder_key"), text("foldername"), nullptr, text("tags"),
                             privacy(text("privacy")), text_of(text("privacy_recursive")) == "yes",
                             nullptr, message);
    if (action == "folder/move")
        return move_folder(session, text("folder_key_src"), text("folder_key_dst"), message);
    if (action == "folder/copy")
        return copy_folder(session, text("folder_key_src"), text("folder_key_dst"), folder,
                           message);
    if (action == "folder/delete")
        return delete_folder(session, text("folder_key"), message);
    if (action == "folder/attach_foreign")
        return attach_foreign_folder(session, text("folder_key"), message);
    if (action == "folder/detach_foreign")
        return detach_foreign_folder(session, text("folder_key"), message);
    if (action == "file/create")
        return create_file(session, text("filename"), nullptr, text("parent_key"), nullptr, file,
                           message);
    if (action == "file/update")
        return update_file(session, text("quick_key"), text("filename"), nullptr, nullptr, nullptr,
                           nullptr, message);
    if (action == "file/move")
        return move_file(session, text("quick_key"), text("folder_key"), message);
    if (action == "file/delete")
        return delete_file(session, text("quick_key"), message);
    throw std::runtime_error("no function for " + action);
}

} // namespace

std::string text_of(const char *text) { return text ? text : ""; }

account_entry known(const folder_info *folder)
{
    return {text_of(folder_info_get_parent_folderkey(folder)),
            text_of(folder_info_get_revision(folder)),
            {{"kind", "folder"},
             {"name", text_of(folder_info_get_foldername(folder))},
             {"tags", text_of(folder_info_get_tags(folder))},
             {"owner", text_of(folder_info_get_owner_name(folder))},
             {"permissions", text_of(folder_info_get_permissions(folder))},
             {"privacy", text_of(folder_info_get_privacy(folder))}}};
}

account_entry known(const file_info *file)
{
    return {text_of(file_info_get_parent_folderkey(file)),
            text_of(file_info_get_revision(file)),
            {{"kind", "file"},
             {"name", text_of(file_info_get_filename(file))},
             {"tags", text_of(file_info_get_tags(file))},
             {"owner", text_of(file_info_get_owner_name(file))},
             {"permissions", text_of(file_info_get_permissions(file))},
             {"privacy", text_of(file_info_get_privacy(file))},
             {"size", text_of(file_info_get_size(file))},
             {"hash", text_of(file_info_get_hash(file))}}};
}

change_outcome changes_by_library::operator()(const std::string &who, const std::string &action,
                                              const pairs &given)
{
    const given_texts texts(given.begin(), given.end());
    char *folder = nullptr;
    char *file = nullptr;
    char *message = nullptr;
    const int32_t status = call(action, sessions_.at(who).c_str(), texts, &folder, &file, &message);
    const std::string said = taken(message);
    EXPECT_GE(status, 0) << action << ": " << said;
    ++calls_[action];
    granted_[action] += status == QM_OK ? 1 : 0;
    return {status == QM_OK, taken(folder), taken(file)};
}

std::string changes_by_library::never_granted() const
{
    std::string names;
    for (const auto &[action, times] : calls_)
        if (granted_.at(action) == 0)
            names += action + ' ';
    return names;
}

listed_account::listed_account(std::string session) : session_(std::move(session))
{
    // The root is where the account's listing begins; it is no entry of it.
    char *message = nullptr;
    folder_info *info = nullptr;
    get_folder_info(session_.c_str(), nullptr, nullptr, nullptr, &message, &info);
    const owned_folder owned(info);
    EXPECT_TRUE(owned) << taken(message);
    root = folder_info_get_folderkey(info);
    list(root);
}

void listed_account::list(const std::string &folder)
{
    for (int chunk = 1; list_chunk(folder, std::to_string(chunk), "files"); ++chunk) {
    }
    for (int chunk = 1; list_chunk(folder, std::to_string(chunk), "folders"); ++chunk) {
    }
}

/** Returns whether there may be another chunk. */
bool listed_account::list_chunk(const std::string &folder, const std::string &chunk,
                                const char *type)
{
    char *message = nullptr;
    folder_list *folder_chunk = nullptr;
    file_list *file_chunk = nullptr;
    int32_t folder_count = 0;
    int32_t file_count = 0;
    int32_t chunk_size = 0;
    const int32_t status =
        get_folder_content(session_.c_str(), folder.c_str(), nullptr, chunk.c_str(), type, &message,
                           &folder_chunk, &folder_count, &file_chunk, &file_count, &chunk_size);
    const owned_folders folders(folder_chunk);
    const owned_files files(file_chunk);
    EXPECT_EQ(status, QM_OK) << taken(message);
    for (const file_list *each = file_chunk ? file_chunk->next : nullptr; each; each = each->next)
        add(file_info_get_quickkey(each->record), known(each->record), folder);
    for (const folder_list *each = folder_chunk ? folder_chunk->next : nullptr; each;
         each = each->next) {
        add(folder_info_get_folderkey(each->record), known(each->record), folder);
        list(folder_info_get_folderkey(each->record));
    }
    return folder_count + file_count >= chunk_size;
}

void listed_account::add(const std::string &key, account_entry entry, const std::string &folder)
{
    entry.parent = folder;
    EXPECT_TRUE(found.emplace(key, std::move(entry)).second) << "listed twice: " << key;
}

} // namespace quillmere_test
