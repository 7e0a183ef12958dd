// Content that comes from this machine's files, the dump, and the way back to the beginning.
#include "loading.h"

#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>

#include "dump.h"
#include "files.h"
#include "socket_client.h"
#include "store/accounts.h"
#include "store/reset.h"
#include "tree_fixture.h"

using namespace emulator;
namespace fs = std::filesystem;

namespace {

class Loading : public Tree {
protected:
    Loading()
    {
        fs::create_directories(source / "photos/2026");
        fs::create_directories(source / "empty");
        write_file(source / "readme.txt", "read me", 0600);
        write_file(source / "photos/2026/a.jpg", "picture", 0600);
        write_file(source / "photos/2026/b.jpg", "picture", 0600);
    }

    loading into(const std::string &who = ann)
    {
        return {store, content, find_account(store, who).value(), time};
    }

    std::string put(const std::string &path, const std::string &bytes)
    {
        const fs::path from = scratch.path() / "from";
        write_file(from, bytes, 0600);
        const descriptor opened(::open(from.c_str(), O_RDONLY | O_CLOEXEC));
        return load_bytes(into(), opened.number(), path);
    }

    std::string key_of(const std::string &name, const std::string &folder = {})
    {
        for (const std::string &each :
             elements(ask("1.0/folder/get_content", {{"folder_key", folder}}).body, "folder"))
            if (element(each, "name") == name)
                return element(each, "folderkey");
        return "none";
    }

    std::size_t kept_files() const
    {
        std::size_t count = 0;
        for (const auto &each : fs::recursive_directory_iterator(scratch.path() / "content"))
            count += each.is_regular_file() ? 1 : 0;
        return count;
    }

    const fs::path source = scratch.path() / "source";
};

} // namespace

TEST_F(Loading, MakesTheTreeOfAFolder)
{
    load_tree(into(), source, "/");

    EXPECT_EQ(names_in(""), (std::vector<std::string>{"empty", "photos", "readme.txt"}));
    const std::string photos = key_of("2026", key_of("photos"));
    EXPECT_EQ(names_in(photos), (std::vector<std::string>{"a.jpg", "b.jpg"}));
    EXPECT_EQ(folder_says("", "total_size"), "21");
}

TEST_F(Loading, GoesBelowAPath)
{
    load_tree(into(), source, "/backup/today/");
    load_tree(into(), source / "readme.txt", "other.txt");

    EXPECT_EQ(names_in(""), (std::vector<std::string>{"backup", "other.txt"}));
    EXPECT_EQ(names_in(key_of("today", key_of("backup"))).size(), 3u);
}

TEST_F(Loading, KeepsTheSameBytesOnce)
{
    load_tree(into(), source, "/");
    load_tree(into(bob), source, "/");

    EXPECT_EQ(kept_files(), 2u);
}

TEST_F(Loading, TouchesNothingThatIsTheSame)
{
    load_tree(into(), source, "/");
    const std::uint64_t before = revision();

    load_tree(into(), source, "/");

    EXPECT_EQ(revision(), before);
}

TEST_F(Loading, ReplacesTheContentOfAFileThatIsThere)
{
    const std::string key = put("/a/b.txt", "old");

    EXPECT_EQ(put("a//b.txt", "newer"), key);

    EXPECT_EQ(file_says(key, "size"), "5");
    const std::string link = done(ann, "file/get_links", {{"quick_key", key}}, "direct_download");
    EXPECT_EQ(bytes_of(fetch(path_of(link))), "newer");
}

TEST_F(Loading, RefusesWhatIsNeitherFileNorFolderAndLoadsNothing)
{
    fs::create_symlink("/etc", source / "zz-link");

    EXPECT_THROW(load_tree(into(), source, "/"), std::runtime_error);

    EXPECT_EQ(names_in(""), std::vector<std::string>{});
    EXPECT_EQ(revision(), 1u);
}

TEST_F(Loading, RefusesNamesThatNoReplyCouldCarry)
{
    write_file(source / "bad\xFFname", "x", 0600);

    EXPECT_THROW(load_tree(into(), source, "/"), std::runtime_error);
    EXPECT_THROW(put("/a/../b", "x"), std::runtime_error);
    EXPECT_THROW(put("/", "x"), std::runtime_error);
    EXPECT_THROW(put("/a\nb", "x"), std::runtime_error);
}

TEST_F(Loading, EndsWhereTheStorageEnds)
{
    put_account_limits(store, *find_account(store, ann), {10, 0, {}});

    EXPECT_THROW(load_tree(into(), source, "/"), std::exception);

    EXPECT_EQ(names_in(""), std::vector<std::string>{}) << "all or nothing";
}

TEST_F(Loading, RefusesAFolderInTheWayOfAFile)
{
    make_folder("a");
    make_file("b");

    EXPECT_THROW(put("/a", "x"), std::exception);
    EXPECT_THROW(put("/b/c", "x"), std::exception);
}

TEST_F(Loading, ResetEmptiesEveryTreeAndKeepsTheAccounts)
{
    load_tree(into(), source, "/");
    done(bob, "folder/attach_foreign", {{"folder_key", key_of("photos")}});
    const std::string old_root = root();

    reset_trees(store, content);

    for (const std::string &who : {ann, bob}) {
        EXPECT_EQ(names_in("", who), std::vector<std::string>{});
        EXPECT_EQ(revision(who), 1u);
        EXPECT_EQ(done(who, "user/myfiles_revision", {}, "epoch"), "2");
        EXPECT_EQ(error_of(who, "device/get_changes", {{"revision", "2"}, {"device_id", "0"}}),
                  "106")
            << "a client of the life before must begin again";
    }
    EXPECT_EQ(root(), old_root);
    EXPECT_EQ(kept_files(), 0u);
    load_tree(into(), source, "/");
    EXPECT_EQ(names_in("").size(), 3u);
}

TEST_F(Loading, ContentIsKeptOnlyWhole)
{
    const fs::path from = scratch.path() / "from";
    write_file(from, "12345", 0600);
    const descriptor opened(::open(from.c_str(), O_RDONLY | O_CLOEXEC));

    EXPECT_THROW(content.keep(opened.number(), 4), std::runtime_error);

    EXPECT_EQ(kept_files(), 0u);
}

TEST_F(Loading, DumpShowsTheTreesAndNoSecret)
{
    const std::string key = put("/a/b.txt", "text");
    const std::string link =
        path_of(done(ann, "file/get_links", {{"quick_key", key}}, "direct_download"));

    const std::string shown = dump(store);

    for (const std::string &part :
         {std::string("\"ann@example.org\""), std::string("\"b.txt\""), key, root(bob),
          file_says(key, "hash"), std::string("\"revision\": 4")})
        EXPECT_NE(shown.find(part), std::string::npos) << part;
    for (const std::string &secret :
         {sessions[ann], link.substr(10, 32), std::string("quillmere-development-key")})
        EXPECT_EQ(shown.find(secret), std::string::npos) << secret;
}
