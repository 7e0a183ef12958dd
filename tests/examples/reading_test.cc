// The examples that read folders, files and the change feed.
#include <filesystem>

#include <gmock/gmock.h>

#include "examples/examples_fixture.h"

namespace quillmere_test {
namespace {

using testing::StartsWith;

// With three digits.
std::string numbered(const std::string &prefix, int number)
{
    return prefix + std::to_string(1000 + number).substr(1);
}

std::vector<std::string> lines_of(const std::string &text)
{
    std::vector<std::string> lines;
    for (std::size_t at = 0, end; (end = text.find('\n', at)) != text.npos; at = end + 1)
        lines.push_back(text.substr(at, end - at));
    return lines;
}

class ReadingExamples : public Examples {
protected:
    // As many folders and files as are given, in the root, all files with the same
    // three bytes, which are quick to store.
    void fill_root(int folders, int files) const
    {
        const std::filesystem::path from = folder.path_of("content");
        std::filesystem::create_directories(from);
        for (int number = 0; number < folders; ++number)
            std::filesystem::create_directory(from / numbered("folder ", number));
        for (int number = 0; number < files; ++number)
            folder.write("content/" + numbered("file ", number), "abc");
        service.command_output(
            {"put-content", "--account", account_email, "--path", "/", "--from", from.string()});
    }

    // Without the keys, which are random.
    std::string listed(const outcome &ended) const
    {
        EXPECT_EQ(ended.exit_status, 0) << ended.err;
        std::string text;
        for (const std::string &line : lines_of(ended.out))
            text += line.substr(line.find(' ') + 1) + "\n";
        return text;
    }
};

// In the service's order: that of their making.
std::string listing(int folders, int files)
{
    std::string text;
    for (int number = 0; number < folders; ++number)
        text += numbered("- folder ", number) + "\n";
    for (int number = 0; number < files; ++number)
        text += numbered("3 file ", number) + "\n";
    return text;
}

} // namespace

TEST_F(ReadingExamples, ListFolderOfMoreThanOneChunk)
{
    fill_root(200, 3); // the last chunk of folders is full

    EXPECT_EQ(listed(run("list_folder")), listing(200, 3));
}

TEST_F(ReadingExamples, ListFolderOfNothing) { EXPECT_EQ(listed(run("list_folder")), ""); }

TEST_F(ReadingExamples, ListFolderByItsKey)
{
    put("/photos/a b.jpg", "bytes");
    const std::string photos = lines_of(run("list_folder").out).at(0);

    const outcome ended = run("list_folder", {photos.substr(0, photos.find(' '))});

    EXPECT_EQ(listed(ended), "5 a b.jpg\n");
}

TEST_F(ReadingExamples, ListFolderThatIsUnknown)
{
    const outcome ended = run("list_folder", {"unknown"});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, StartsWith("listing failed: 112 Unknown folder"));
}

TEST_F(ReadingExamples, WalkTree)
{
    fill_root(101, 0);
    put("/a/b/deep.txt", "12345");
    put("/a/near.txt", "1");

    const outcome ended = run("walk_tree");

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    std::vector<std::string> expected = {"/a/", "/a/b/", "/a/b/deep.txt", "/a/near.txt", "6 bytes"};
    for (int number = 0; number < 101; ++number)
        expected.push_back(numbered("/folder ", number) + "/");
    EXPECT_THAT(lines_of(ended.out), testing::UnorderedElementsAreArray(expected));
}

TEST_F(ReadingExamples, FollowChanges)
{
    fill_root(600, 0); // more than a block

    std::vector<std::string> first = lines_of(run("follow_changes").out);
    const std::string reached = first.back().substr(first.back().find(' ') + 1);
    first.pop_back();
    const std::string key = put("/a.txt", "bytes");
    const outcome later = run("follow_changes", {reached});

    std::vector<std::string> expected;
    for (const std::string &folder_key : stored_folders())
        expected.push_back("updated folder " + folder_key + " ");
    EXPECT_EQ(first, expected);
    EXPECT_THAT(later.out, StartsWith("updated file " + key + " a.txt\nrevision ")) << later.err;
}

TEST_F(ReadingExamples, FollowChangesToWhatWasDeleted)
{
    const std::string key = put("/a.txt", "bytes");
    library_on_service library(service);
    char *message = nullptr;
    EXPECT_EQ(delete_file(library.session_of(account_email).c_str(), key.c_str(), &message), QM_OK)
        << taken(message);

    const outcome ended = run("follow_changes");

    EXPECT_THAT(ended.out, StartsWith("deleted file " + key + " \nrevision ")) << ended.err;
}

TEST_F(ReadingExamples, FollowChangesFromARevisionThatNeverWas)
{
    const outcome ended = run("follow_changes", {"1000"});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, StartsWith("reading the changes failed: 106 "));
}

TEST_F(ExamplesOnScriptedService, FollowChangesTouchesNoListOfADamagedReply)
{
    server.next({answering(xml_reply("<response><session_token>t</session_token>"
                                     "<result>Success</result></response>")),
                 answering(xml_reply("<response><updated><files><file><quickkey>k</quickkey></file>"
                                     "</files></updated><result>Success</result></respo"))});

    const outcome ended = run("follow_changes");

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, StartsWith("reading the changes failed: -9 "));
    EXPECT_EQ(ended.out, "");
}

TEST_F(ReadingExamples, ManyThreads)
{
    fill_root(0, 30);
    std::vector<std::string> keys;
    for (const auto &[name, file] : stored_files())
        keys.push_back(file.key);

    const outcome ended = run("many_threads", keys);

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(ended.out, listing(0, 30));
}

TEST_F(ReadingExamples, ManyThreadsOfWhichOneFails)
{
    const std::string key = put("/a.txt", "bytes");

    const outcome ended = run("many_threads", {key, "unknown", key});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_EQ(ended.out, "5 a.txt\n5 a.txt\n");
    EXPECT_EQ(ended.err, "113 Unknown file\n");
}

} // namespace quillmere_test
