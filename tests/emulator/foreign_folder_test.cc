// Folders of one account in the tree of another.
#include "socket_client.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

class ForeignFolder : public Tree {
protected:
    ForeignFolder()
    {
        top = make_folder("top");
        inner = make_folder("inner", top);
        file = make_file("a", inner);
    }

    void attach(const std::string &key)
    {
        done(bob, "folder/attach_foreign", {{"folder_key", key}});
    }
    void detach(const std::string &key)
    {
        done(bob, "folder/detach_foreign", {{"folder_key", key}});
    }

    std::string bobs_feed(std::uint64_t after = 0)
    {
        return ask(bob, "device/get_changes",
                   {{"revision", std::to_string(after)}, {"device_id", "1"}})
            .body;
    }

    std::string top, inner, file;
};

} // namespace

TEST_F(ForeignFolder, LiesInTheRootOfWhoAttachedIt)
{
    attach(top);

    EXPECT_EQ(names_in("", bob), std::vector<std::string>{"top"});
    EXPECT_EQ(folder_says(top, "parent_folderkey", bob), root(bob));
    EXPECT_EQ(folder_says(inner, "parent_folderkey", bob), top);
    EXPECT_EQ(folder_says("", "folder_count", bob), "1");
    EXPECT_EQ(file_says(file, "parent_folderkey", bob), inner);
}

TEST_F(ForeignFolder, TellsWhoseItIs)
{
    attach(top);

    EXPECT_EQ(folder_says(top, "owner_name", bob), "ann");
    EXPECT_EQ(folder_says(top, "flag", bob), "1");
    EXPECT_EQ(folder_says(top, "permissions", bob), "read");
    EXPECT_EQ(folder_says(top, "shared", bob), "yes");
    EXPECT_EQ(folder_says(top, "shared_by_user", bob), "no");
    EXPECT_EQ(folder_says(inner, "shared"), "yes");
    EXPECT_EQ(file_says(file, "shared_by_user"), "yes");
}

TEST_F(ForeignFolder, BringsItsTreeIntoTheFeed)
{
    attach(top);

    const std::string body = bobs_feed();

    EXPECT_EQ(elements(element(body, "updated"), "folderkey"),
              (std::vector<std::string>{top, inner}));
    EXPECT_EQ(elements(element(body, "updated"), "quickkey"), std::vector<std::string>{file});
    EXPECT_EQ(element(body, "device_revision"), "4");
}

TEST_F(ForeignFolder, ChangesReachWhoAttachedIt)
{
    attach(top);
    const std::uint64_t before = revision(bob);

    const std::string added = make_file("b", inner);
    done(ann, "file/delete", {{"quick_key", file}});

    EXPECT_EQ(elements(element(bobs_feed(before), "updated"), "quickkey"),
              std::vector<std::string>{added});
    EXPECT_EQ(elements(element(bobs_feed(before), "deleted"), "quickkey"),
              std::vector<std::string>{file});
}

TEST_F(ForeignFolder, LeavesTheFeedWhenDetached)
{
    attach(top);
    detach(top);

    const std::string body = bobs_feed();

    EXPECT_EQ(element(body, "updated"), "");
    EXPECT_EQ(elements(element(body, "deleted"), "folder").size(), 2u);
    EXPECT_EQ(elements(element(body, "deleted"), "quickkey"), std::vector<std::string>{file});
    EXPECT_EQ(names_in("", bob), std::vector<std::string>{});
    EXPECT_EQ(folder_says(top, "shared"), "no");
}

TEST_F(ForeignFolder, GoesWhenItsOwnerDeletesIt)
{
    attach(inner);
    const std::uint64_t before = revision(bob);

    done(ann, "folder/delete", {{"folder_key", top}});

    EXPECT_EQ(elements(element(bobs_feed(before), "deleted"), "folderkey"),
              std::vector<std::string>{inner});
    EXPECT_EQ(names_in("", bob), std::vector<std::string>{});
}

TEST_F(ForeignFolder, ComesAndGoesWithAMoveOfItsOwner)
{
    attach(top);
    const std::string other = make_folder("other");
    const std::uint64_t before = revision(bob);

    done(ann, "folder/move", {{"folder_key_src", inner}, {"folder_key_dst", other}});
    const std::string left = bobs_feed(before);
    done(ann, "folder/move", {{"folder_key_src", inner}, {"folder_key_dst", top}});
    const std::string back = bobs_feed(before);

    EXPECT_EQ(elements(element(left, "deleted"), "folderkey"), std::vector<std::string>{inner});
    EXPECT_EQ(elements(element(left, "deleted"), "quickkey"), std::vector<std::string>{file});
    EXPECT_EQ(elements(element(back, "updated"), "folderkey"), std::vector<std::string>{inner});
    EXPECT_EQ(elements(element(back, "updated"), "quickkey"), std::vector<std::string>{file});
    EXPECT_EQ(element(back, "deleted"), "");
}

TEST_F(ForeignFolder, InsideAnotherAttachedOneLiesInTheRootAlone)
{
    attach(top);
    attach(inner);

    EXPECT_EQ(names_in("", bob), (std::vector<std::string>{"top", "inner"}));
    EXPECT_EQ(names_in(top, bob), std::vector<std::string>{});
    detach(inner);
    EXPECT_EQ(names_in(top, bob), std::vector<std::string>{"inner"});
    EXPECT_EQ(folder_says(inner, "parent_folderkey", bob), top);
}

TEST_F(ForeignFolder, RecursivePrivacyReachesWhoAttachedAPart)
{
    attach(inner);
    const std::uint64_t before = revision(bob);

    done(ann, "folder/update",
         {{"folder_key", top}, {"privacy", "private"}, {"privacy_recursive", "yes"}});

    EXPECT_EQ(elements(bobs_feed(before), "folderkey"), std::vector<std::string>{inner});
    EXPECT_EQ(elements(bobs_feed(before), "quickkey"), std::vector<std::string>{file});
}

TEST_F(ForeignFolder, StaysVisibleWhenItBecomesPrivate)
{
    attach(top);
    done(ann, "folder/update",
         {{"folder_key", top}, {"privacy", "private"}, {"privacy_recursive", "yes"}});

    EXPECT_EQ(names_in(top, bob), std::vector<std::string>{"inner"});
}

TEST_F(ForeignFolder, CanBeCopiedButNotChanged)
{
    attach(top);

    const std::string copy = done(bob, "folder/copy", {{"folder_key_src", top}}, "new_folderkey");

    EXPECT_EQ(folder_says(copy, "owner_name", bob), "bob");
    EXPECT_EQ(folder_says(copy, "total_files", bob), "1");
    EXPECT_EQ(error_of(bob, "folder/create", {{"foldername", "x"}, {"parent_key", top}}), "114");
    EXPECT_EQ(error_of(bob, "file/delete", {{"quick_key", file}}), "114");
}

TEST_F(ForeignFolder, RefusesWhatCannotBeAttached)
{
    const auto attach_error = [this](const std::string &key) {
        return error_of(bob, "folder/attach_foreign", {{"folder_key", key}});
    };
    const std::string own = make_folder("own", "", bob);
    const std::string hidden = make_folder("hidden");
    done(ann, "folder/update", {{"folder_key", hidden}, {"privacy", "private"}});
    attach(top);

    EXPECT_EQ(attach_error(top), "122") << "twice";
    EXPECT_EQ(attach_error(own), "122");
    EXPECT_EQ(attach_error(root()), "121");
    EXPECT_EQ(attach_error(hidden), "114");
    EXPECT_EQ(attach_error("none"), "112");
    EXPECT_EQ(attach_error(""), "104");
    EXPECT_EQ(error_of(bob, "folder/detach_foreign", {{"folder_key", inner}}), "122");
    EXPECT_EQ(error_of(bob, "folder/detach_foreign", {{"folder_key", "none"}}), "112");
}

TEST_F(ForeignFolder, CountsTowardsTheDay)
{
    EXPECT_EQ(done(bob, "user/get_limits", {}, "collaboration_today"), "0");

    attach(top);

    EXPECT_EQ(done(bob, "user/get_limits", {}, "collaboration_today"), "1");
    time += 24 * 60 * 60;
    EXPECT_EQ(done(bob, "user/get_limits", {}, "collaboration_today"), "0");
}
