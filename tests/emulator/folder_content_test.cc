// Listings and their chunks.
#include "socket_client.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

class FolderContent : public Tree {
protected:
    std::string content(const pairs &given) { return ask("1.0/folder/get_content", given).body; }

    void make_files(int count)
    {
        for (int number = 0; number < count; ++number)
            make_file("f" + std::to_string(number));
    }
};

} // namespace

TEST_F(FolderContent, ListsFoldersAndFilesWithTheirElements)
{
    const std::string folder = make_folder("folder");
    const std::string file = make_file("file.txt");
    done(ann, "file/update", {{"quick_key", file}, {"description", "text"}});

    const std::string body = content({});

    EXPECT_EQ(element(body, "action"), "folder/get_content");
    EXPECT_EQ(element(body, "chunk_size"), "100");
    const std::string first = element(element(body, "folders"), "folder");
    EXPECT_EQ(element(first, "folderkey"), folder);
    for (const char *name :
         {"name", "created", "description", "tags", "folder_count", "file_count", "revision",
          "epoch", "shared", "owner_name", "delete_date", "custom_url", "dropbox_enabled", "flag",
          "shared_by_user", "permissions", "avatar", "privacy"})
        EXPECT_EQ(elements(first, name).size(), 1u) << name;
    const std::string second = element(element(body, "files"), "file");
    EXPECT_EQ(element(second, "quickkey"), file);
    EXPECT_EQ(element(second, "desc"), "text");
    for (const char *name : {"filename", "created", "downloads", "tags", "size", "privacy",
                             "filetype", "mimetype", "hash", "delete_date", "password_protected",
                             "revision", "owner_name", "flag", "shared_by_user", "permissions"})
        EXPECT_EQ(elements(second, name).size(), 1u) << name;
}

TEST_F(FolderContent, IsOfTheKindAskedFor)
{
    make_folder("folder");
    make_file("file");

    EXPECT_EQ(elements(content({{"content_type", "folders"}}), "files").size(), 0u);
    EXPECT_EQ(elements(content({{"content_type", "files"}}), "folders").size(), 0u);
    EXPECT_EQ(elements(content({{"content_type", ""}}), "quickkey").size(), 1u);
    EXPECT_EQ(error_of("1.0/folder/get_content", {{"content_type", "all"}}), "106");
}

TEST_F(FolderContent, OfAnEmptyFolderIsEmpty)
{
    const std::string body = content({{"folder_key", make_folder("a")}});

    EXPECT_EQ(elements(body, "folderkey").size() + elements(body, "quickkey").size(), 0u);
    EXPECT_EQ(element(body, "result"), "Success");
}

TEST_F(FolderContent, ComesInChunksThatHoldEachEntryOnce)
{
    make_files(201);

    std::vector<std::string> all;
    for (const char *chunk : {"1", "2", "3", "4"})
        for (const std::string &name :
             elements(content({{"content_type", "files"}, {"chunk", chunk}}), "filename"))
            all.push_back(name);

    ASSERT_EQ(all.size(), 201u);
    for (std::size_t number = 0; number < all.size(); ++number)
        EXPECT_EQ(all[number], "f" + std::to_string(number)) << "in the order they were made";
    EXPECT_EQ(elements(content({{"content_type", "files"}, {"chunk", "3"}}), "file").size(), 1u);
}

TEST_F(FolderContent, WithoutAKindIsOneSequenceOfFoldersThenFiles)
{
    for (int number = 0; number < 60; ++number)
        make_folder("d" + std::to_string(number));
    make_files(60);

    const std::string first = content({{"chunk", "1"}});
    const std::string second = content({{"chunk", "2"}});

    EXPECT_EQ(elements(first, "folderkey").size(), 60u);
    EXPECT_EQ(elements(first, "quickkey").size(), 40u);
    EXPECT_EQ(elements(second, "folderkey").size(), 0u);
    EXPECT_EQ(elements(second, "quickkey").size(), 20u);
    EXPECT_EQ(elements(second, "filename").front(), "f40");
}

TEST_F(FolderContent, ChunksCountFromOne)
{
    for (const char *chunk : {"0", "-1", "one", "4294967296"})
        EXPECT_EQ(error_of("1.0/folder/get_content", {{"chunk", chunk}}), "106") << chunk;
    EXPECT_EQ(error_of("1.0/folder/get_content", {{"chunk", "4294967295"}}), "");
}

TEST_F(FolderContent, WantsAFolderThatThereIs)
{
    EXPECT_EQ(error_of("1.0/folder/get_content", {{"folder_key", "none"}}), "112");
    EXPECT_EQ(error_of(nobody, "1.0/folder/get_content", {}), "105");
    EXPECT_EQ(error_of("1.0/folder/get_content", {{"device_id", "x"}}), "106");
}
