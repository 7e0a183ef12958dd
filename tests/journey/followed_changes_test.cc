// A client that makes changes through the library, and one that knows of them by the feed alone.
#include <map>

#include <gtest/gtest.h>

#include "journey/account_client.h"

namespace quillmere_test {
namespace {

constexpr const char *ann = "ann@example.org";
constexpr const char *bob = "bob@example.org";

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

    account_entry described(const change_info *change) const
    {
        const char *key = change_info_get_key(change);
        account_entry entry = change_info_get_is_folder(change) ? folder(key) : file(key);
        entry.parent = text_of(change_info_get_parent_folderkey(change));
        entry.revision = std::to_string(change_info_get_revision(change));
        return entry;
    }

    account_entry folder(const char *key) const
    {
        char *message = nullptr;
        folder_info *info = nullptr;
        const int32_t status =
            get_folder_info(session_.c_str(), key, nullptr, nullptr, &message, &info);
        const owned_folder owned(info);
        EXPECT_EQ(status, QM_OK) << taken(message);
        return known(info);
    }

    account_entry file(const char *key) const
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
