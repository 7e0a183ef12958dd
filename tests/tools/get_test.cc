// Downloading from the command line, as a user would.
#include <csignal>
#include <filesystem>

#include <gmock/gmock.h>

#include "transfer_account.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class Get : public transfer_account {
protected:
    outcome get(std::vector<std::string> arguments) const
    {
        arguments.insert(arguments.begin(), "get");
        return home.run(arguments);
    }
};

} // namespace

TEST_F(Get, BringsAFileUnderItsName)
{
    put_content("/photos/a.jpg", "picture");

    const outcome ended = done({"get", "/photos/a.jpg", download_path()});

    EXPECT_EQ(ended.out, "Downloaded /photos/a.jpg to " + download_path("a.jpg") + "\n");
    EXPECT_EQ(content_of(download_path("a.jpg")), "picture");
    EXPECT_THAT(downloaded(), ElementsAre("a.jpg"));
}

TEST_F(Get, TakesTheWorkingFolderOrANewNameAsDestination)
{
    put_content("/a.jpg", "picture");
    command here = home.with({"get", "/a.jpg"});
    here.folder = download_path();

    EXPECT_EQ(run(here).exit_status, 0);
    done({"get", "/a.jpg", download_path("b.jpg")});

    EXPECT_EQ(content_of(download_path("a.jpg")), "picture");
    EXPECT_EQ(content_of(download_path("b.jpg")), "picture");
    EXPECT_EQ(get({"/a.jpg", download_path("missing/b.jpg")}).exit_status, 9);
}

TEST_F(Get, ReplacesAFileAndLeavesOneThatIsTheSame)
{
    put_content("/a.txt", "remote");
    home.folder().write("downloads/a.txt", "local");

    EXPECT_THAT(done({"get", "/a.txt", download_path()}).out, HasSubstr("Downloaded"));
    EXPECT_EQ(content_of(download_path("a.txt")), "remote");
    EXPECT_EQ(done({"get", "/a.txt", download_path()}).out,
              download_path("a.txt") + " is up to date\n");
}

TEST_F(Get, BringsAFolderWithAllThatItHolds)
{
    put_content("/tree/a.txt", "a");
    put_content("/tree/deep/er/b.txt", "b");
    done({"mkdir", "/tree/empty"});

    const outcome ended = done({"get", "-r", "/tree", download_path()});

    EXPECT_EQ(ended.out, "Downloaded 2 files (2 B)\n");
    EXPECT_EQ(content_of(download_path("tree/deep/er/b.txt")), "b");
    EXPECT_TRUE(fs::is_directory(download_path("tree/empty")));
    EXPECT_EQ(get({"/tree", download_path()}).exit_status, 2) << "without -r";
    done({"get", "-r", "/tree", download_path("new")});
    EXPECT_EQ(content_of(download_path("new/a.txt")), "a");
    done({"get", "-r", "/", download_path("all")});
    EXPECT_EQ(content_of(download_path("all/tree/a.txt")), "a");
}

TEST_F(Get, GoesOnWhereAnEarlierDownloadEnded)
{
    const std::string bytes = some_bytes(300'000);
    put_content("/large", bytes);
    const std::string partial = ".quillmere-" + sha256_of(bytes) + ".part";
    home.folder().write("downloads/" + partial, bytes.substr(0, 200'000));

    const outcome ended = done({"get", "--verbose", "/large", download_path()});

    EXPECT_EQ(sha256_of_file(download_path("large")), sha256_of(bytes));
    EXPECT_THAT(downloaded(), ElementsAre("large"));
    EXPECT_EQ(result_of({"stat", "/large"}).at("downloads"), 0)
        << "what follows later is the rest of a download that was counted when it began";
}

TEST_F(Get, BeginsAnewWhenTheBeginningIsSpoilt)
{
    const std::string bytes = some_bytes(300'000);
    put_content("/large", bytes);
    home.folder().write("downloads/.quillmere-" + sha256_of(bytes) + ".part",
                        some_bytes(200'000, 2));

    done({"get", "/large", download_path()});

    EXPECT_EQ(sha256_of_file(download_path("large")), sha256_of(bytes));
    EXPECT_THAT(downloaded(), ElementsAre("large"));
}

TEST_F(Get, NeedsNoFetchWhenTheBeginningIsTheWhole)
{
    put_content("/a.txt", "all of it");
    home.folder().write("downloads/.quillmere-" + sha256_of("all of it") + ".part", "all of it");

    done({"get", "/a.txt", download_path()});

    EXPECT_EQ(content_of(download_path("a.txt")), "all of it");
    EXPECT_EQ(result_of({"stat", "/a.txt"}).at("downloads"), 0);
}

TEST_F(Get, IsNotLedOutOfItsFolderByLinks)
{
    put_content("/tree/folder/a.txt", "from the service");
    put_content("/tree/b.txt", "from the service");
    const std::string outside = home.folder().path_of("outside");
    fs::create_directories(outside);
    fs::create_directories(download_path("tree"));
    fs::create_directory_symlink(outside, download_path("tree/folder"));
    fs::create_symlink(outside + "/b.txt", download_path("tree/b.txt"));

    const outcome ended = get({"-r", "/tree", download_path()});

    EXPECT_EQ(ended.exit_status, 8) << ended.err;
    EXPECT_TRUE(fs::is_empty(outside));
    EXPECT_EQ(content_of(download_path("tree/b.txt")), "from the service");
    EXPECT_FALSE(fs::is_symlink(download_path("tree/b.txt")));
}

TEST_F(Get, RefusesWhatHasNoBytes)
{
    done({"create", "/nothing"});
    put_content("/tree/a.txt", "a");
    done({"create", "/tree/nothing"});

    EXPECT_EQ(get({"/nothing", download_path()}).exit_status, 3);
    EXPECT_EQ(get({"-r", "/tree", download_path()}).exit_status, 8);
    EXPECT_EQ(get({"/missing", download_path()}).exit_status, 3);
    EXPECT_THAT(downloaded(), ElementsAre("tree"));
    EXPECT_EQ(content_of(download_path("tree/a.txt")), "a");
}

TEST_F(Get, RefusesToReplaceAFolderByAFile)
{
    put_content("/a", "x");
    fs::create_directory(download_path("a"));

    EXPECT_EQ(get({"/a", download_path()}).exit_status, 9);
    EXPECT_THAT(downloaded(), ElementsAre("a"));
}

TEST_F(Get, SaysWhyThereIsNoLink)
{
    emulator_command({"add-account", "--email", "poor@example.org", "--password-file", "-",
                      "--bandwidth-limit", "0"},
                     "secret\n");
    done({"login", "poor@example.org", "--password-stdin"}, "secret\n");
    done({"put", "-", "/a"}, "x");

    const outcome ended = get({"/a", download_path()});

    EXPECT_EQ(ended.exit_status, 3);
    EXPECT_THAT(ended.err, HasSubstr("119"));
    EXPECT_THAT(downloaded(), IsEmpty());
}

} // namespace quillmere_test
