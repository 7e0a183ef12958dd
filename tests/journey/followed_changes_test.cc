// A client that makes changes through the library, and one that knows of them by the feed alone.
#include <map>

#include <gtest/gtest.h>

#include "emulator/random_changes.h"
#include "journey/emulated_service.h"

namespace quillmere_test {
namespace {

using pairs = std::vector<std::pair<std::string, std::string>>;
using given_texts = std::map<std::string, std::string>;

constexpr const char *ann = "ann@example.org";
constexpr const char *bob = "bob@example.org";

template <class Record, void (*release)(Record **)> struct deleted_by {
    void operator()(Record *record) const { release(&record); }
};
using owned_folder = std::unique_ptr<folder_info, deleted_by<folder_info, folder_info_delete>>;
using owned_file = std::unique_ptr<file_info, deleted_by<file_info, file_info_delete>>;
using owned_folders = std::unique_ptr<folder_list, deleted_by<folder_list, delete_all_folder_list>>;
using owned_files = std::unique_ptr<file_list, deleted_by<file_list, delete_all_file_list>>;
using owned_changes = std::unique_ptr<change_list, deleted_by<change_list, delete_all_change_list>>;

std::string text_of(const char *text) { return text ? text : ""; }

known_entry known(const folder_info *folder)
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

known_entry known(const file_info *file)
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

// What a test names by its action, done by the function that an application would call.
class changes_by_library {
public:
    explicit changes_by_library(std::map<std::string, std::string> sessions)
        : sessions_(std::move(sessions))
    {
    }

    change_outcome operator()(const std::string &who, const std::string &action, const pairs &given)
    {
        const given_texts texts(given.begin(), given.end());
        char *folder = nullptr;
        char *file = nullptr;
        char *message = nullptr;
        const int32_t status =
            call(action, sessions_.at(who).c_str(), texts, &folder, &file, &message);
        const std::string said = taken(message);
        EXPECT_GE(status, 0) << action << ": " << said;
        ++calls_[action];
        granted_[action] += status == QM_OK ? 1 : 0;
        return {status == QM_OK, taken(folder), taken(file)};
    }

    /** The actions that were never granted, which the run therefore says nothing of. */
    std::string never_granted() const
    {
        std::string names;
        for (const auto &[action, times] : calls_)
            if (granted_.at(action) == 0)
                names += action + ' ';
        return names;
    }

private:
    static int32_t call(const std::string &action, const char *session, const given_texts &given,
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
            return update_folder(session, text("folder_key"), text("foldername"), nullptr,
                                 text("tags"), privacy(text("privacy")),
                                 text_of(text("privacy_recursive")) == "yes", nullptr, message);
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
            return create_file(session, text("filename"), nullptr, text("parent_key"), nullptr,
                               file, message);
        if (action == "file/update")
            return update_file(session, text("quick_key"), text("filename"), nullptr, nullptr,
                               nullptr, nullptr, message);
        if (action == "file/move")
            return move_file(session, text("quick_key"), text("folder_key"), message);
        if (action == "file/delete")
            return delete_file(session, text("quick_key"), message);
        throw std::runtime_error("no function for " + action);
    }

    static int32_t privacy(const char *text)
    {
        const std::string wanted = text_of(text);
        return wanted.empty() ? 0 : wanted == "public" ? -1 : 1;
    }

    std::map<std::string, std::string> sessions_;
    std::map<std::string, int> calls_;
    std::map<std::string, int> granted_;
};

/** Knows what the feed told, and nothing else. */
class follower {
public:
    explicit follower(std::string session) : session_(std::move(session)) {}

    const entries &known_entries() const { return known_; }

    /** Asks from where it stands until the feed has nothing more to tell. */
    void follow()
    {
        while (follow_block()) {
        }
    }

private:
    bool follow_block()
    {
        uint64_t reached = 0;
        uint32_t count = 0;
        int32_t block = 0;
        char *message = nullptr;
        change_list *list = nullptr;
        const int32_t status = get_device_changes(session_.c_str(), revision_, 0, &reached, &list,
                                                  &count, &block, &message);
        const owned_changes changes(list);
        EXPECT_EQ(status, QM_OK) << taken(message);
        apply(changes.get());
        const bool is_behind = reached != revision_;
        revision_ = reached;
        return is_behind;
    }

    void apply(const change_list *changes)
    {
        for (const change_list *each = changes->next; each; each = each->next) {
            const std::string key = change_info_get_key(each->record);
            if (change_info_get_changetype(each->record) == 0)
                known_.erase(key);
            else
                known_[key] = described(each->record);
        }
    }

    known_entry described(const change_info *change) const
    {
        const char *key = change_info_get_key(change);
        known_entry entry = change_info_get_is_folder(change) ? folder(key) : file(key);
        entry.parent = text_of(change_info_get_parent_folderkey(change));
        entry.revision = std::to_string(change_info_get_revision(change));
        return entry;
    }

    known_entry folder(const char *key) const
    {
        char *message = nullptr;
        folder_info *info = nullptr;
        const int32_t status =
            get_folder_info(session_.c_str(), key, nullptr, nullptr, &message, &info);
        const owned_folder owned(info);
        EXPECT_EQ(status, QM_OK) << taken(message);
        return known(info);
    }

    known_entry file(const char *key) const
    {
        char *message = nullptr;
        file_info *info = nullptr;
        const int32_t status = get_file_info(key, session_.c_str(), &message, &info);
        const owned_file owned(info);
        EXPECT_EQ(status, QM_OK) << taken(message);
        return known(info);
    }

    std::string session_;
    uint64_t revision_ = 0;
    entries known_;
};

/** Everything that the account's listings show, folder by folder and chunk by chunk. */
class listed_account {
public:
    explicit listed_account(std::string session) : session_(std::move(session))
    {
        // The root is where the account's listing begins; it is no entry of it.
        char *message = nullptr;
        folder_info *info = nullptr;
        get_folder_info(session_.c_str(), nullptr, nullptr, nullptr, &message, &info);
        const owned_folder root(info);
        EXPECT_TRUE(root) << taken(message);
        list(folder_info_get_folderkey(info));
    }

    entries found;

private:
    void list(const std::string &folder)
    {
        for (int chunk = 1; list_chunk(folder, std::to_string(chunk), "files"); ++chunk) {
        }
        for (int chunk = 1; list_chunk(folder, std::to_string(chunk), "folders"); ++chunk) {
        }
    }

    /** Returns whether there may be another chunk. */
    bool list_chunk(const std::string &folder, const std::string &chunk, const char *type)
    {
        char *message = nullptr;
        folder_list *folder_chunk = nullptr;
        file_list *file_chunk = nullptr;
        int32_t folder_count = 0;
        int32_t file_count = 0;
        int32_t chunk_size = 0;
        const int32_t status = get_folder_content(
            session_.c_str(), folder.c_str(), nullptr, chunk.c_str(), type, &message, &folder_chunk,
            &folder_count, &file_chunk, &file_count, &chunk_size);
        const owned_folders folders(folder_chunk);
        const owned_files files(file_chunk);
        EXPECT_EQ(status, QM_OK) << taken(message);
        for (const file_list *each = file_chunk ? file_chunk->next : nullptr; each;
             each = each->next)
            add(file_info_get_quickkey(each->record), known(each->record), folder);
        for (const folder_list *each = folder_chunk ? folder_chunk->next : nullptr; each;
             each = each->next) {
            add(folder_info_get_folderkey(each->record), known(each->record), folder);
            list(folder_info_get_folderkey(each->record));
        }
        return folder_count + file_count >= chunk_size;
    }

    void add(const std::string &key, known_entry entry, const std::string &folder)
    {
        entry.parent = folder;
        EXPECT_TRUE(found.emplace(key, std::move(entry)).second) << "listed twice: " << key;
    }

    std::string session_;
};

class FollowedChanges : public testing::Test {
protected:
    FollowedChanges()
    {
        for (const char *who : {ann, bob})
            service.add_account(who);
        library = std::make_unique<library_on_service>(service, reached_over::plain);
        for (const char *who : {ann, bob})
            sessions[who] = library->session_of(who);
    }

    emulated_service service;
    std::unique_ptr<library_on_service> library;
    std::map<std::string, std::string> sessions;
};

} // namespace

TEST_F(FollowedChanges, EndWithWhatTheListingsShow)
{
    changes_by_library by_library(sessions);
    random_changes client(20261120, std::ref(by_library));
    follower anns(sessions[ann]);
    follower bobs(sessions[bob]);
    follower late(sessions[ann]); // asks but in the end, so that it has blocks to catch up

    int granted = 0;
    for (int step = 1; granted < QUILLMERE_CHANGES; ++step) {
        const bool is_ann = step % 3 != 0;
        granted += client.change(is_ann ? ann : bob, is_ann ? bob : ann) ? 1 : 0;
        if (step % 40 == 0) {
            anns.follow();
            bobs.follow();
            client.learn(ann, anns.known_entries());
            client.learn(bob, bobs.known_entries());
        }
        if (step % 1000 == 0) {
            ASSERT_EQ(difference(anns.known_entries(), listed_account(sessions[ann]).found), "")
                << "after " << step;
        }
    }

    for (follower *each : {&anns, &bobs, &late})
        each->follow();
    const entries truth = listed_account(sessions[ann]).found;
    EXPECT_EQ(difference(anns.known_entries(), truth), "");
    EXPECT_EQ(difference(late.known_entries(), truth), "");
    EXPECT_EQ(difference(bobs.known_entries(), listed_account(sessions[bob]).found), "");
    EXPECT_GT(truth.size(), 50u) << "the run left hardly anything to compare";
    EXPECT_EQ(by_library.never_granted(), "");
}

} // namespace quillmere_test
