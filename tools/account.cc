#include "account.h"

#include "commands/commands.h"
#include "failure.h"
#include "folder_content.h"
#include "text.h"

namespace quillmere::tools {

namespace {

remote_entry entry_of(const folder_info *record)
{
    return {entry_kind::folder, text_or_empty(folder_info_get_folderkey(record)),
            text_or_empty(folder_info_get_foldername(record)),
            text_or_empty(folder_info_get_parent_folderkey(record))};
}

remote_entry entry_of(const file_info *record)
{
    return {entry_kind::file, text_or_empty(file_info_get_quickkey(record)),
            text_or_empty(file_info_get_filename(record)),
            text_or_empty(file_info_get_parent_folderkey(record))};
}

template <class Record>
std::vector<remote_entry> entries_of(const std::vector<const Record *> &records,
                                     const remote_entry &folder)
{
    std::vector<remote_entry> entries;
    for (const Record *each : records) {
        entries.push_back(entry_of(each));
        entries.back().parent_key = folder.key; // which a listing does not repeat
    }
    return entries;
}

std::vector<remote_entry> list(const account &owner, const remote_entry &folder, entry_kind kind)
{
    const folder_content content = read_content(owner, folder, {kind});
    return kind == entry_kind::folder ? entries_of(content.folders, folder)
                                      : entries_of(content.files, folder);
}

remote_entry describe_file(const account &owner, const std::string &key, const failure &no_folder)
{
    try {
        return entry_of(read_file(owner, key).get());
    } catch (failure &problem) {
        problem.why = no_folder.why + "; " + problem.why;
        throw;
    }
}

// A key does not tell whether it is a folder's or a file's.
remote_entry describe(const account &owner, const std::string &key)
{
    try {
        return entry_of(read_folder(owner, key.c_str()).get());
    } catch (const failure &problem) {
        if (problem.code != exit_code::refused)
            throw;
        return describe_file(owner, key, problem);
    }
}

} // namespace

account signed_in_account(command_context &context)
{
    std::string token = require_session(context).token;
    return {context.remote(), std::move(token)};
}

folder_info_owner read_folder(const account &owner, const char *key_or_null)
{
    folder_info *record = nullptr;
    owner.remote.read("reading the folder", [&](char **error_message) {
        return get_folder_info(owner.session(), key_or_null, nullptr, nullptr, error_message,
                               &record);
    });
    return folder_info_owner(record);
}

file_info_owner read_file(const account &owner, const std::string &key)
{
    file_info *record = nullptr;
    owner.remote.read("reading the file", [&](char **error_message) {
        return get_file_info(key.c_str(), owner.session(), error_message, &record);
    });
    return file_info_owner(record);
}

remote_tree tree_of(const account &owner)
{
    return {
        [&owner](const remote_entry &folder, entry_kind kind) { return list(owner, folder, kind); },
        [&owner](const std::string &key) { return describe(owner, key); }};
}

remote_entry find_movable(const remote_tree &tree, const std::string &path, const char *verb)
{
    remote_entry found = find_entry(tree, path);
    if (found.is_root())
        throw failure(exit_code::usage, std::string("the account's root cannot be ") + verb,
                      "name something in it");
    return found;
}

} // namespace quillmere::tools
