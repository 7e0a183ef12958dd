// Changes of the account's tree. Each is one request, which is never repeated unasked.
#pragma once

#include <optional>
#include <string>

#include "account.h"

namespace quillmere::tools {

/** Makes a folder. A failure, too, when the service does not tell the key of what it made. */
remote_entry create_folder_in(const account &owner, const remote_entry &folder,
                              const std::string &name,
                              const std::optional<std::string> &time = std::nullopt);

/** Makes an empty file; likewise. */
remote_entry create_file_in(const account &owner, const remote_entry &folder,
                            const std::string &name,
                            const std::optional<std::string> &time = std::nullopt);

/** Copies an entry into a folder, where the service may number its name; likewise. */
remote_entry copy_into(const account &owner, const remote_entry &entry, const remote_entry &folder);

void move_into(const account &owner, const remote_entry &entry, const remote_entry &folder);
void remove_entry(const account &owner, const remote_entry &entry);

/** What is to become of an entry; what is not given stays. */
struct entry_update {
    std::optional<std::string> name;
    std::optional<std::string> description; ///< empty to clear it
    std::optional<std::string> tags;        ///< likewise
    std::optional<std::string> privacy;     ///< "public" or "private"
    std::optional<std::string> time;
    bool recursive = false; ///< a folder's new privacy is that of all it holds, too
};

void update_entry(const account &owner, const remote_entry &entry, const entry_update &update);

/** A new name alone. */
void rename_entry(const account &owner, const remote_entry &entry, const std::string &name);

} // namespace quillmere::tools
