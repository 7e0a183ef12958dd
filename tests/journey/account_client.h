// An application of the library that changes accounts, and one that lists them.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "emulator/random_changes.h"
#include "journey/emulated_service.h"

namespace quillmere_test {

using pairs = std::vector<std::pair<std::string, std::string>>;

template <class Record, void (*release)(Record **)> struct deleted_by {
    void operator()(Record *record) const { release(&record); }
};
using owned_folder = std::unique_ptr<folder_info, deleted_by<folder_info, folder_info_delete>>;
using owned_file = std::unique_ptr<file_info, deleted_by<file_info, file_info_delete>>;
using owned_folders = std::unique_ptr<folder_list, deleted_by<folder_list, delete_all_folder_list>>;
using owned_files = std::unique_ptr<file_list, deleted_by<file_list, delete_all_file_list>>;
using owned_changes = std::unique_ptr<change_list, deleted_by<change_list, delete_all_change_list>>;

// What a record says of its entry; nothing for NULL.
std::string text_of(const char *text);
account_entry known(const folder_info *folder);
account_entry known(const file_info *file);

// What a test names by its action, done by the function that an application would call.
class changes_by_library {
public:
    explicit changes_by_library(std::map<std::string, std::string> sessions)
        : sessions_(std::move(sessions))
    {
    }

    change_outcome operator()(const std::string &who, const std::string &action,
                              const pairs &given);

    /** The actions that were never granted, which the run therefore says nothing of. */
    std::string never_granted() const;

private:
    std::map<std::string, std::string> sessions_;
    std::map<std::string, int> calls_;
    std::map<std::string, int> granted_;
};

/** Everything that the account's listings show, folder by folder and chunk by chunk. */
class listed_account {
public:
    explicit listed_account(std::string session);

    std::string root;
    entries found;

private:
    void list(const std::string &folder);
    bool list_chunk(const std::string &folder, const std::string &chunk, const char *type);
    void add(const std::string &key, account_entry entry, const std::string &folder);

    std::string session_;
};

} // namespace quillmere_test
