// Following paths through a tree that the test makes up.
#include "remote_path.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "failure.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/** A tree of entries, and what was asked of it. */
class fake_tree {
public:
    void add(entry_kind kind, const std::string &key, const std::string &name,
             const std::string &parent = "")
    {
        entries_.push_back({kind, key, name, parent});
    }

    remote_tree tree()
    {
        return {[this](const remote_entry &folder, entry_kind kind) { return list(folder, kind); },
                [this](const std::string &key) { return describe(key); }};
    }

    std::vector<std::string> asked;

private:
    std::vector<remote_entry> list(const remote_entry &folder, entry_kind kind)
    {
        asked.push_back(std::string(word_for(kind)) + "s of " + folder.key);
        std::vector<remote_entry> found;
        for (const remote_entry &each : entries_)
            if (each.kind == kind && each.parent_key == folder.key)
                found.push_back(each);
        return found;
    }

    remote_entry describe(const std::string &key)
    {
        asked.push_back("entry " + key);
        for (const remote_entry &each : entries_)
            if (each.key == key)
                return each;
        throw failure(exit_code::refused, "nothing has the key " + key);
    }

    std::vector<remote_entry> entries_;
};

class RemotePath : public testing::Test {
protected:
    RemotePath()
    {
        fake.add(entry_kind::folder, "p", "photos");
        fake.add(entry_kind::folder, "y", "2026", "p");
        fake.add(entry_kind::file, "f", "a.jpg", "y");
        fake.add(entry_kind::file, "t", "todo.txt");
    }

    remote_place follow(const std::string &path) { return follow_path(fake.tree(), path); }
    std::string key_of(const std::string &path) { return find_entry(fake.tree(), path).key; }

    exit_code failure_of(const std::string &path)
    {
        try {
            find_entry(fake.tree(), path);
        } catch (const failure &problem) {
            return problem.code;
        }
        return exit_code::done;
    }

    fake_tree fake;
};

TEST_F(RemotePath, LeadsFromTheRootToFoldersAndFiles)
{
    EXPECT_EQ(key_of("/photos"), "p");
    EXPECT_EQ(key_of("/photos/2026"), "y");
    EXPECT_EQ(key_of("/photos/2026/a.jpg"), "f");
    EXPECT_EQ(key_of("/todo.txt"), "t");
}

TEST_F(RemotePath, KnowsWhatItFoundAndWhere)
{
    const remote_entry found = find_entry(fake.tree(), "/photos/2026/a.jpg");

    EXPECT_EQ(found.kind, entry_kind::file);
    EXPECT_EQ(found.name, "a.jpg");
    EXPECT_EQ(found.parent_key, "y");
}

TEST_F(RemotePath, NeedsNoSlashAtTheFrontAndMindsNoneTooMany)
{
    for (const char *path : {"photos/2026", "//photos///2026", "/photos/2026/", "photos/2026//"})
        EXPECT_EQ(key_of(path), "y") << path;
}

TEST_F(RemotePath, ToTheRootAsksNothing)
{
    const remote_entry root = find_entry(fake.tree(), "/");

    EXPECT_TRUE(root.is_root());
    EXPECT_TRUE(root.is_folder());
    EXPECT_EQ(root.key_or_null(), nullptr);
    EXPECT_THAT(fake.asked, IsEmpty());
}

TEST_F(RemotePath, ReadsFoldersAloneOnTheWay)
{
    key_of("/photos/2026/a.jpg");

    EXPECT_THAT(fake.asked,
                ElementsAre("folders of ", "folders of p", "folders of y", "files of y"));
}

TEST_F(RemotePath, MayBeginWithAKey)
{
    EXPECT_EQ(key_of("key:f"), "f");
    EXPECT_EQ(key_of("key:p/"), "p");
    EXPECT_EQ(key_of("key:p/2026/a.jpg"), "f");
    EXPECT_THAT(fake.asked, ElementsAre("entry f", "entry p", "entry p", "folders of p",
                                        "folders of y", "files of y"));
}

TEST_F(RemotePath, WithAKeyBehindASlashIsAName)
{
    fake.add(entry_kind::folder, "k", "key:p");

    EXPECT_EQ(key_of("/key:p"), "k");
}

TEST_F(RemotePath, TellsHowFarItLeads)
{
    const remote_place place = follow("/photos/2027/trips/");

    EXPECT_FALSE(place.exists());
    EXPECT_EQ(place.reached.key, "p");
    EXPECT_THAT(place.missing, ElementsAre("2027", "trips"));
    EXPECT_TRUE(place.folder_meant);
    EXPECT_FALSE(follow("/photos/2027").folder_meant);
}

TEST_F(RemotePath, ThatLeadsNowhereIsAFailure)
{
    EXPECT_EQ(failure_of("/nothing"), exit_code::refused);
    EXPECT_EQ(failure_of("/photos/nothing/a.jpg"), exit_code::refused);
    EXPECT_EQ(failure_of("key:nothing"), exit_code::refused);
}

TEST_F(RemotePath, MindsLetterCaseInNames) { EXPECT_EQ(failure_of("/Photos"), exit_code::refused); }

TEST_F(RemotePath, CannotLeadThroughAFile)
{
    for (const char *path : {"/todo.txt/a", "/todo.txt/", "key:t/a", "key:t/"}) {
        try {
            follow(path);
            ADD_FAILURE() << path;
        } catch (const failure &problem) {
            EXPECT_EQ(problem.code, exit_code::refused) << path;
            EXPECT_EQ(problem.why, "todo.txt is a file, not a folder") << path;
        }
    }
}

TEST_F(RemotePath, ToAFileIsNoneToAFolder)
{
    EXPECT_EQ(find_folder(fake.tree(), "/photos").key, "p");
    EXPECT_THROW(find_folder(fake.tree(), "/todo.txt"), failure);
}

TEST_F(RemotePath, IsNotGuessedWhereANameIsThereTwice)
{
    fake.add(entry_kind::folder, "p2", "photos");
    fake.add(entry_kind::folder, "t2", "todo.txt");

    for (const char *path : {"/photos", "/photos/2026", "/todo.txt"})
        EXPECT_EQ(failure_of(path), exit_code::usage) << path;
    try {
        follow("/photos");
    } catch (const failure &problem) {
        EXPECT_THAT(problem.advice, HasSubstr("key:p or key:p2"));
    }
}

TEST_F(RemotePath, OfAFolderTakesTheFolderOfTwoThatShareAName)
{
    fake.add(entry_kind::folder, "t2", "todo.txt");

    EXPECT_EQ(key_of("/todo.txt/"), "t2");
}

TEST_F(RemotePath, ThatIsNoneIsWrongUsage)
{
    for (const char *path : {"", ".", "/photos/..", "/./photos", "key:", "key:/photos", "key:a&b",
                             "key:a b", "key:a%20", "key:a?"})
        EXPECT_EQ(failure_of(path), exit_code::usage) << path;
    EXPECT_THAT(fake.asked, IsEmpty());
}

TEST(KeyInPath, IsAloneThere)
{
    EXPECT_EQ(key_in("key:a-b_c.9~Z"), "a-b_c.9~Z");
    EXPECT_EQ(key_in("key:a/b"), std::nullopt);
    EXPECT_EQ(key_in("/key:a"), std::nullopt);
    EXPECT_THROW(key_in("key:"), failure);
    EXPECT_THROW(key_in("key:a&b"), failure);
}

TEST(PathBelow, HasOneSlashBetween)
{
    EXPECT_EQ(path_below("/", "a"), "/a");
    EXPECT_EQ(path_below("/b/", "a"), "/b/a");
    EXPECT_EQ(path_below("key:k", "a"), "key:k/a");
}

} // namespace
} // namespace quillmere_test
