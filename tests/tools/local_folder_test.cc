// Where downloads end, and what their beginnings are worth.
#include <filesystem>

#include <sys/stat.h>

#include <gtest/gtest.h>

#include "failure.h"
#include "support/temporary_folder.h"
#include "transfers/local_folder.h"
#include "transfers/partial_file.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using namespace quillmere::tools;

const expected_content abc_content = {
    3, "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad"};

class LocalFolder : public testing::Test {
protected:
    temporary_folder outside;
    const std::string path = outside.path_of("inside");
    const bool made = fs::create_directory(path);
    const local_folder folder{path};
    const std::string partial = path + "/" + partial_file::name_for(abc_content);
};

} // namespace

TEST_F(LocalFolder, TakesNoNameThatLeadsOutOfIt)
{
    for (const std::string &name :
         {std::string(), std::string("."), std::string(".."), std::string("../a"),
          std::string("/tmp"), std::string("a/b"), std::string("a\0b", 3)}) {
        EXPECT_THROW(check_local_name(name), failure) << name;
        EXPECT_THROW(folder.enter(name), failure) << name;
    }
    for (const char *name : {"...", "-", "a b", "..a", "\\", "\xff", "\n", "~"})
        EXPECT_NO_THROW(check_local_name(name)) << name;
}

TEST_F(LocalFolder, IsLeftThroughNoLink)
{
    fs::create_directory_symlink(outside.path(), path + "/link");

    EXPECT_THROW(folder.enter("link"), failure);
    EXPECT_EQ(folder.entry("link"), local_entry::other);
}

TEST_F(LocalFolder, MakesTheFolderThatIsEntered)
{
    const local_folder inner = folder.enter("a").enter("b");

    EXPECT_EQ(inner.path(), path + "/a/b");
    EXPECT_TRUE(fs::is_directory(path + "/a/b"));
    EXPECT_EQ(folder.enter("a").entry("b"), local_entry::folder);
}

TEST_F(LocalFolder, KnowsAFileByItsBytes)
{
    outside.write("inside/same", "abc");
    outside.write("inside/other", "abd");
    outside.write("inside/longer", "abcd");
    fs::create_symlink(path + "/same", path + "/link");

    EXPECT_TRUE(folder.has("same", abc_content));
    for (const char *name : {"other", "longer", "link", "missing"})
        EXPECT_FALSE(folder.has(name, abc_content)) << name;
}

TEST_F(LocalFolder, GetsAFileWhenItIsWhole)
{
    {
        partial_file file(folder.number(), abc_content);
        file.append("ab");
        file.append("c");
        EXPECT_FALSE(fs::exists(path + "/name"));
        ASSERT_TRUE(file.is_right());
        file.rename_to("name");
    }

    EXPECT_EQ(content_of(path + "/name"), "abc");
    EXPECT_FALSE(fs::exists(partial));
}

TEST_F(LocalFolder, KeepsTheBeginningOfAFile)
{
    {
        partial_file file(folder.number(), abc_content);
        file.append("ab");
    }

    partial_file again(folder.number(), abc_content);

    EXPECT_EQ(again.size(), 2u);
    EXPECT_EQ(again.missing(), 1u);
    again.append("c");
    EXPECT_TRUE(again.is_right());
}

TEST_F(LocalFolder, KeepsNothingOfNothing)
{
    {
        partial_file file(folder.number(), abc_content);
        EXPECT_TRUE(fs::exists(partial));
    }

    EXPECT_FALSE(fs::exists(partial));
}

TEST_F(LocalFolder, DropsABeginningThatIsTooLong)
{
    outside.write("inside/" + partial_file::name_for(abc_content), "longer than it");

    const partial_file file(folder.number(), abc_content);

    EXPECT_EQ(file.size(), 0u);
}

TEST_F(LocalFolder, IsRightWithTheRightBytesAlone)
{
    partial_file file(folder.number(), abc_content);
    file.append("abd");
    EXPECT_FALSE(file.is_right());
    file.restart();
    file.append("ab");
    EXPECT_FALSE(file.is_right());
    file.restart();
    file.append("abc");
    EXPECT_TRUE(file.is_right());
}

TEST_F(LocalFolder, TakesNoLinkAndNoPipeForABeginning)
{
    fs::create_symlink(outside.path_of("elsewhere"), partial);
    EXPECT_THROW(partial_file(folder.number(), abc_content), failure);
    EXPECT_FALSE(fs::exists(outside.path_of("elsewhere")));

    fs::remove(partial);
    ASSERT_EQ(::mkfifo(partial.c_str(), 0600), 0);
    EXPECT_THROW(partial_file(folder.number(), abc_content), failure);
}

TEST_F(LocalFolder, HasEachBeginningWorkedOnOnce)
{
    const partial_file first(folder.number(), abc_content);

    EXPECT_THROW(partial_file(folder.number(), abc_content), failure);
}

} // namespace quillmere_test
