// The change feed: a client that follows it alone knows the account.
#include <map>
#include <set>

#include "random_changes.h"
#include "socket_client.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

// What a feed must keep true. Counts of folders and downloads are no changes of an entry.
constexpr const char *folder_facts[] = {"name",       "description", "tags",
                                        "owner_name", "permissions", "privacy"};
constexpr const char *file_facts[] = {"filename", "tags",       "size",       "hash",
                                      "privacy",  "owner_name", "permissions"};

class Changes : public Tree {
protected:
    std::string feed(std::uint64_t after, const std::string &who = ann)
    {
        const reply made = ask(who, "device/get_changes",
                               {{"revision", std::to_string(after)}, {"device_id", "0"}});
        EXPECT_EQ(made.http_status, 200u) << made.body;
        return made.body;
    }

    account_entry describe(const std::string &who, const std::string &kind, const std::string &key)
    {
        const bool is_folder = kind == "folder";
        const std::string body =
            ask(who, kind + "/get_info", {{is_folder ? "folder_key" : "quick_key", key}}).body;
        account_entry entry{element(body, "parent_folderkey"), element(body, "revision"), {}};
        if (is_folder)
            for (const char *fact : folder_facts)
                entry.info[fact] = element(body, fact);
        else
            for (const char *fact : file_facts)
                entry.info[fact] = element(body, fact);
        entry.info["kind"] = kind;
        return entry;
    }

    change_outcome told(const std::string &who, const std::string &action, const pairs &given)
    {
        const reply made = ask(who, action, given);
        EXPECT_NE(made.http_status, 500u) << action << made.body;
        return {made.http_status == 200, element(made.body, "folder_key"),
                element(made.body, "quickkey")};
    }

    /** Follows the feed as a client would, from where it stands to where the account is. */
    struct replica {
        std::string who;
        std::uint64_t revision = 0;
        entries known;
    };

    void follow(replica &copy)
    {
        for (;;) {
            const std::string body = feed(copy.revision, copy.who);
            apply(copy, body);
            const std::uint64_t reached = std::stoull(element(body, "device_revision"));
            if (reached == copy.revision)
                return;
            copy.revision = reached;
        }
    }

    void apply(replica &copy, const std::string &body)
    {
        for (const char *kind : {"folder", "file"}) {
            const char *key = kind == std::string("folder") ? "folderkey" : "quickkey";
            for (const std::string &each : elements(element(body, "updated"), kind)) {
                account_entry entry = describe(copy.who, kind, element(each, key));
                entry.parent = element(each, "parent_folderkey");
                entry.revision = element(each, "revision");
                copy.known[element(each, key)] = entry;
            }
            for (const std::string &each : elements(element(body, "deleted"), kind))
                copy.known.erase(element(each, key));
        }
    }

    /** Everything that the listings show, chunk by chunk, folder by folder. */
    entries listed(const std::string &who)
    {
        entries all;
        list_into(who, root(who), all);
        return all;
    }

    void list_into(const std::string &who, const std::string &folder, entries &all)
    {
        for (const std::string &key : keys_in(who, folder, "files", "quickkey"))
            add(who, "file", folder, key, all);
        for (const std::string &key : keys_in(who, folder, "folders", "folderkey")) {
            add(who, "folder", folder, key, all);
            list_into(who, key, all);
        }
    }

    void add(const std::string &who, const std::string &kind, const std::string &folder,
             const std::string &key, entries &all)
    {
        account_entry entry = describe(who, kind, key);
        EXPECT_EQ(entry.parent, folder) << "a listing and a description disagree";
        EXPECT_TRUE(all.emplace(key, std::move(entry)).second) << "listed twice: " << key;
    }

    std::vector<std::string> keys_in(const std::string &who, const std::string &folder,
                                     const std::string &type, const std::string &element_name)
    {
        std::vector<std::string> all;
        for (int chunk = 1;; ++chunk) {
            const std::string body = ask(who, "1.0/folder/get_content",
                                         {{"folder_key", folder},
                                          {"chunk", std::to_string(chunk)},
                                          {"content_type", type}})
                                         .body;
            const std::vector<std::string> keys = elements(body, element_name);
            all.insert(all.end(), keys.begin(), keys.end());
            if (keys.size() < 100)
                return all;
        }
    }
};

} // namespace

TEST_F(Changes, OfAnEmptyAccountAreNone)
{
    const std::string body = feed(0);

    EXPECT_EQ(element(body, "updated"), "");
    EXPECT_EQ(element(body, "deleted"), "");
    EXPECT_EQ(element(body, "device_revision"), "1");
    EXPECT_EQ(element(body, "changes_list_block"), "500");
}

TEST_F(Changes, TellOfANewFile)
{
    const std::string folder = make_folder("photos");
    const std::string file = make_file("a.png", folder);

    const std::string entry = element(element(feed(0), "updated"), "file");

    EXPECT_EQ(element(entry, "quickkey"), file);
    EXPECT_EQ(element(entry, "parent_folderkey"), folder);
    EXPECT_EQ(element(entry, "revision"), file_says(file, "revision"));
    EXPECT_EQ(element(entry, "created"), "2023-11-14 22:13:20");
    EXPECT_EQ(element(entry, "filename"), "a.png");
    EXPECT_EQ(element(entry, "mimetype"), "image/png");
    EXPECT_EQ(element(entry, "filetype"), "image");
}

TEST_F(Changes, HoldAnEntryOnceWithItsNewestRevision)
{
    const std::string folder = make_folder("one");
    done(ann, "folder/update", {{"folder_key", folder}, {"foldername", "two"}});
    done(ann, "folder/update", {{"folder_key", folder}, {"tags", "t"}});

    const std::string body = feed(0);

    ASSERT_EQ(elements(body, "folder").size(), 1u);
    EXPECT_EQ(element(element(body, "folder"), "revision"), std::to_string(revision()));
    EXPECT_EQ(elements(feed(revision()), "folder").size(), 0u);
}

TEST_F(Changes, TellOfEachEntryOfADeletedTree)
{
    const std::string top = make_folder("top");
    const std::string inner = make_folder("inner", top);
    make_file("a", top);
    make_file("b", inner);
    const std::uint64_t before = revision();

    done(ann, "folder/delete", {{"folder_key", top}});

    const std::string body = feed(before);
    EXPECT_EQ(elements(element(body, "deleted"), "folder").size(), 2u);
    EXPECT_EQ(elements(element(body, "deleted"), "file").size(), 2u);
    EXPECT_EQ(revision(), before + 4) << "each change has a revision of its own";
}

TEST_F(Changes, GiveEveryChangeARevisionOfItsOwn)
{
    std::set<std::string> seen;
    const std::string top = make_folder("top");
    for (const char *name : {"a", "b", "c"})
        make_file(name, top);
    done(ann, "folder/copy", {{"folder_key_src", top}});

    const std::vector<std::string> revisions = elements(feed(0), "revision");

    EXPECT_EQ(revisions.size(), 8u);
    for (const std::string &each : revisions)
        EXPECT_TRUE(seen.insert(each).second) << each;
}

TEST_F(Changes, ComeInBlocksThatSayHowFarTheyReach)
{
    for (int number = 0; number < 501; ++number)
        make_file("f" + std::to_string(number));

    const std::string first = feed(0);
    const std::string second = feed(std::stoull(element(first, "device_revision")));

    EXPECT_EQ(elements(first, "quickkey").size(), 500u);
    EXPECT_EQ(element(first, "device_revision"), "501");
    EXPECT_EQ(elements(second, "quickkey").size(), 1u);
    EXPECT_EQ(element(second, "device_revision"), "502");
    EXPECT_EQ(elements(feed(1), "quickkey").size(), 500u);
    EXPECT_EQ(element(feed(2), "device_revision"), "502") << "exactly a block is the last one";
}

TEST_F(Changes, WantARevisionThatTheAccountHasReached)
{
    make_file("a");

    for (const char *revision : {"3", "-1", "one", "18446744073709551615"})
        EXPECT_EQ(error_of("device/get_changes", {{"revision", revision}, {"device_id", "0"}}),
                  "106")
            << revision;
    EXPECT_EQ(error_of("device/get_changes", {{"device_id", "0"}}), "104");
    EXPECT_EQ(error_of("device/get_changes", {{"revision", "0"}}), "104");
    EXPECT_EQ(error_of(nobody, "device/get_changes", {{"revision", "0"}}), "105");
}

TEST_F(Changes, BelongToOneAccount)
{
    make_file("a");

    EXPECT_EQ(elements(feed(0, bob), "quickkey").size(), 0u);
    EXPECT_EQ(revision(bob), 1u);
}

TEST_F(Changes, FollowedAloneGiveWhatTheListingsShow)
{
    random_changes client(20260301,
                          [this](const std::string &who, const std::string &action,
                                 const pairs &given) { return told(who, action, given); });
    replica anns{ann, 0, {}};
    replica bobs{bob, 0, {}};
    // A second one asks seldom, so that it has blocks to catch up.
    replica late{ann, 0, {}};

    int granted = 0;
    for (int step = 1; granted < QUILLMERE_CHANGES; ++step) {
        const bool is_ann = step % 3 != 0;
        granted += client.change(is_ann ? ann : bob, is_ann ? bob : ann) ? 1 : 0;
        if (step % 40 != 0)
            continue;
        follow(anns);
        follow(bobs);
        client.learn(ann, anns.known);
        client.learn(bob, bobs.known);
        if (step % 400 != 0)
            continue;
        ASSERT_EQ(difference(anns.known, listed(ann)), "") << "after " << step;
        ASSERT_EQ(difference(bobs.known, listed(bob)), "") << "after " << step;
    }

    follow(anns);
    follow(bobs);
    follow(late);
    const entries truth = listed(ann);
    EXPECT_EQ(difference(anns.known, truth), "");
    EXPECT_EQ(difference(late.known, truth), "");
    EXPECT_EQ(difference(bobs.known, listed(bob)), "");
    EXPECT_GT(truth.size(), 50u) << "the run left hardly anything to compare";
}
