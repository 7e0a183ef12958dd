// What a mirror makes of listings and of the feed, without a network.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "failure.h"
#include "mirror/known_account.h"
#include "mirror/layout.h"
#include "mirror/local_names.h"
#include "mirror/state.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::ElementsAre;
using testing::IsEmpty;

known_entry folder_called(const std::string &name)
{
    known_entry entry;
    entry.name = name;
    return entry;
}

known_entry file_called(const std::string &name, const std::string &sha256 = "1")
{
    known_entry entry;
    entry.kind = entry_kind::file;
    entry.name = name;
    entry.content = {7, sha256};
    return entry;
}

entry_change updated(const std::string &key, const std::string &parent,
                     entry_kind kind = entry_kind::file)
{
    return {key, kind, false, parent};
}

entry_change deleted(const std::string &key) { return {key, entry_kind::file, true, ""}; }

/** Of a root "r" with a folder "f", in which a file "a" is, and a file "b". */
known_account small_account()
{
    known_account account;
    account.root = "r";
    account.begin(10, "1");
    account.add_listing("r", {{"f", folder_called("folder")}, {"b", file_called("b.txt")}});
    account.add_listing("f", {{"a", file_called("a.txt")}});
    return account;
}

std::vector<std::string> paths_of(const layout &made)
{
    std::vector<std::string> paths;
    for (const std::string &key : made.order)
        paths.push_back(made.path_of(key));
    return paths;
}

} // namespace

TEST(KnownAccount, IsToBeListedFolderByFolder)
{
    known_account account;
    account.root = "r";

    account.begin(10, "1");
    EXPECT_THAT(account.unfinished(), ElementsAre("r"));
    account.add_listing("r", {{"f", folder_called("folder")}, {"b", file_called("b.txt")}});
    EXPECT_THAT(account.unfinished(), ElementsAre("f"));
    account.add_listing("f", {});

    EXPECT_THAT(account.unfinished(), IsEmpty());
}

TEST(KnownAccount, ForgetsWhatTheFeedDeletesWithAllThatItHeld)
{
    known_account account = small_account();

    account.apply({deleted("f")}, 11);

    EXPECT_EQ(account.entries.count("a"), 0u);
    EXPECT_EQ(account.entries.count("b"), 1u);
    EXPECT_EQ(account.revision, 11u);
}

TEST(KnownAccount, ForgetsWhatIsMovedOut)
{
    known_account account = small_account();

    account.apply({updated("f", "elsewhere", entry_kind::folder)}, 11);

    EXPECT_EQ(account.entries.size(), 2u) << "the root and one file";
}

TEST(KnownAccount, IsToListAndDescribeWhatIsMovedIn)
{
    known_account account = small_account();

    account.apply({updated("g", "f", entry_kind::folder), updated("elsewhere", "unknown")}, 11);

    EXPECT_THAT(account.unfinished(), ElementsAre("g"));
    account.add_listing("g", {});
    EXPECT_THAT(account.unfinished(), ElementsAre("g")) << "its own name is not in its listing";
}

TEST(KnownAccount, TakesAFolderAndItsParentInAnyOrder)
{
    known_account account = small_account();

    account.apply(
        {updated("inner", "outer", entry_kind::folder), updated("outer", "r", entry_kind::folder)},
        12);

    EXPECT_EQ(account.entries.count("inner"), 1u);
}

TEST(KnownAccount, LeavesAnEntryWhereTheFeedPutIt)
{
    known_account account = small_account();
    account.apply({updated("g", "f", entry_kind::folder)}, 11);

    account.add_listing("g", {{"f", folder_called("folder")}, {"b", file_called("new")}});

    EXPECT_EQ(account.entries.at("f").parent, "r") << "or it would lie in itself";
    EXPECT_EQ(account.entries.at("b").name, "b.txt");
}

TEST(KnownAccount, IsAToldStateAgain)
{
    mirror_state state;
    state.account = small_account();
    state.here["a"] = {entry_kind::file, "f", "\xc3\xa4 \"b\"\n", {7, "1"}, {3, 7, -5}};
    state.here["f"] = {entry_kind::folder, "r", "folder", {}, {9, 0, 0}, true};

    const mirror_state again = state_in(text_of(state));

    EXPECT_EQ(text_of(again), text_of(state));
    EXPECT_EQ(again.here.at("a").stamp.modified, -5);
    EXPECT_TRUE(again.here.at("f").set_aside);
    EXPECT_EQ(again.account.entries.at("a").content.sha256, "1");
}

TEST(KnownAccount, IsNotReadFromATextThatIsNoState)
{
    mirror_state led_out;
    led_out.here["a"] = {entry_kind::file, "f", "../a", {7, "1"}, {3, 7, 5}};
    mirror_state bad_key;
    bad_key.here["../a"] = {entry_kind::file, "f", "a", {7, "1"}, {3, 7, 5}};

    for (const std::string &text : {std::string(), std::string("{}"), std::string("{\"format\":2}"),
                                    text_of(led_out), text_of(bad_key)})
        EXPECT_THROW(state_in(text), failure) << text;
}

TEST(Layout, PutsEveryEntryAtItsPath)
{
    const layout made = lay_out(small_account());

    EXPECT_THAT(paths_of(made), ElementsAre("folder", "b.txt", "folder/a.txt"));
    EXPECT_THAT(made.left_out, IsEmpty());
}

TEST(Layout, LeavesOutWhatNoFileCanBeCalledWithAllThatItHolds)
{
    for (const std::string &name :
         {std::string(".."), std::string("."), std::string("a/b"), std::string("/etc"),
          std::string("a\0b", 3), std::string(256, 'x'), std::string(".quillmere-mirror")}) {
        known_account account = small_account();
        account.entries.at("f").name = name;

        const layout made = lay_out(account);

        EXPECT_THAT(paths_of(made), ElementsAre("b.txt")) << name;
        ASSERT_EQ(made.left_out.size(), 1u) << name;
        EXPECT_EQ(made.left_out[0].key, "f");
    }
}

TEST(Layout, KeepsTheMirrorsOwnNameFreeAtTheTopAlone)
{
    known_account account = small_account();

    account.entries.at("a").name = ".quillmere-mirror";

    EXPECT_THAT(lay_out(account).left_out, IsEmpty());
}

TEST(Layout, ShowsOneOfSeveralOfAName)
{
    known_account account = small_account();
    account.add_listing("r", {{"c", file_called("b.txt")}, {"d", file_called("folder")}});

    const layout made = lay_out(account);

    EXPECT_THAT(paths_of(made), ElementsAre("folder", "b.txt", "folder/a.txt"));
    EXPECT_EQ(*made.key_at("r", "b.txt"), "b") << "the smaller key";
    EXPECT_EQ(*made.key_at("r", "folder"), "f") << "the folder";
    EXPECT_EQ(made.left_out.size(), 2u);
}

TEST(NameBeside, IsNeverTooLongAndNeverCutInACharacter)
{
    EXPECT_EQ(name_beside("a.txt", 2), "a.txt.local-2");
    EXPECT_EQ(name_beside(std::string(255, 'x'), 1), std::string(247, 'x') + ".local-1");
    const std::string long_name = std::string(246, 'x') + "\xc3\xa4" + std::string(7, 'x');
    EXPECT_EQ(name_beside(long_name, 1), std::string(246, 'x') + ".local-1");
}

} // namespace quillmere_test
