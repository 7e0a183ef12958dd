#include "remote_changes.h"

#include "failure.h"

namespace quillmere::tools {

namespace {

const char *text_or_null(const std::optional<std::string> &text)
{
    return text ? text->c_str() : nullptr;
}

// How the library takes a folder's privacy.
std::int32_t privacy_number(const std::optional<std::string> &privacy)
{
    constexpr std::int32_t make_public = -1;
    constexpr std::int32_t keep = 0;
    constexpr std::int32_t make_private = 1;
    if (!privacy)
        return keep;
    return *privacy == "private" ? make_private : make_public;
}

// Without its key nothing more could be done with it; and an entry without one is the root.
remote_entry made_entry(const remote_entry &model, char *key, const std::string &action)
{
    const heap_text owned(key);
    if (key == nullptr || *key == '\0')
        throw failure(exit_code::partly_done,
                      action + " succeeded, but the service did not tell the new key",
                      "look for it with: quillmere ls");
    remote_entry made = model;
    made.key = key;
    return made;
}

} // namespace

remote_entry create_folder_in(const account &owner, const remote_entry &folder,
                              const std::string &name, const std::optional<std::string> &time)
{
    const std::string action = "creating the folder " + name;
    char *key = nullptr;
    owner.remote.once(action, [&](char **error_message) {
        return create_folder(owner.session(), name.c_str(), folder.key_or_null(),
                             text_or_null(time), &key, error_message);
    });
    return made_entry({entry_kind::folder, {}, name, folder.key}, key, action);
}

remote_entry create_file_in(const account &owner, const remote_entry &folder,
                            const std::string &name, const std::optional<std::string> &time)
{
    const std::string action = "creating the file " + name;
    char *key = nullptr;
    owner.remote.once(action, [&](char **error_message) {
        return create_file(owner.session(), name.c_str(), nullptr, folder.key_or_null(),
                           text_or_null(time), &key, error_message);
    });
    return made_entry({entry_kind::file, {}, name, folder.key}, key, action);
}

remote_entry copy_into(const account &owner, const remote_entry &entry, const remote_entry &folder)
{
    const auto copy = entry.is_folder() ? copy_folder : copy_file;
    const std::string action = "copying " + entry.name;
    char *key = nullptr;
    owner.remote.once(action, [&](char **error_message) {
        return copy(owner.session(), entry.key.c_str(), folder.key_or_null(), &key, error_message);
    });
    return made_entry({entry.kind, {}, entry.name, folder.key}, key, action);
}

void move_into(const account &owner, const remote_entry &entry, const remote_entry &folder)
{
    const auto move = entry.is_folder() ? move_folder : move_file;
    owner.remote.once("moving " + entry.name, [&](char **error_message) {
        return move(owner.session(), entry.key.c_str(), folder.key_or_null(), error_message);
    });
}

void remove_entry(const account &owner, const remote_entry &entry)
{
    const auto remove = entry.is_folder() ? delete_folder : delete_file;
    owner.remote.once("removing " + entry.name, [&](char **error_message) {
        return remove(owner.session(), entry.key.c_str(), error_message);
    });
}

void update_entry(const account &owner, const remote_entry &entry, const entry_update &update)
{
    const char *const name = text_or_null(update.name);
    const char *const description = text_or_null(update.description);
    const char *const tags = text_or_null(update.tags);
    const char *const time = text_or_null(update.time);
    owner.remote.once("changing " + entry.name, [&](char **error_message) {
        if (entry.is_folder())
            return update_folder(owner.session(), entry.key.c_str(), name, description, tags,
                                 privacy_number(update.privacy), update.recursive, time,
                                 error_message);
        return update_file(owner.session(), entry.key.c_str(), name, description, tags,
                           text_or_null(update.privacy), time, error_message);
    });
}

void rename_entry(const account &owner, const remote_entry &entry, const std::string &name)
{
    entry_update update;
    update.name = name;
    update_entry(owner, entry, update);
}

} // namespace quillmere::tools
