// Files: their entries and their metadata.
#include "digest.h"
#include "socket_client.h"
#include "store/accounts.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

class File : public Tree {
protected:
    std::string create(const pairs &given) { return done(ann, "file/create", given, "quickkey"); }
};

} // namespace

TEST_F(File, NewOneIsDescribed)
{
    const std::string key = create({{"filename", "a <b>.jpg"}});

    const std::string info = ask("file/get_info", {{"quick_key", key}}).body;
    const std::map<std::string, std::string> expected = {{"quickkey", key},
                                                         {"parent_folderkey", root()},
                                                         {"downloads", "0"},
                                                         {"filename", "a &lt;b&gt;.jpg"},
                                                         {"description", ""},
                                                         {"created", "2023-11-14 22:13:20"},
                                                         {"tags", ""},
                                                         {"size", "0"},
                                                         {"privacy", "public"},
                                                         {"filetype", "image"},
                                                         {"hash", ""},
                                                         {"mimetype", "image/jpeg"},
                                                         {"delete_date", ""},
                                                         {"password_protected", "no"},
                                                         {"revision", "2"},
                                                         {"owner_name", "ann"},
                                                         {"flag", "0"},
                                                         {"shared_by_user", "no"},
                                                         {"permissions", "write"}};
    for (const auto &[name, value] : expected)
        EXPECT_EQ(elements(info, name), std::vector<std::string>{value}) << name;
}

TEST_F(File, ContentGivesItASizeAndAHash)
{
    const std::string key = make_file("a");

    fill(key, "hello");

    EXPECT_EQ(file_says(key, "size"), "5");
    // SHA-256 of "hello", computed elsewhere.
    EXPECT_EQ(file_says(key, "hash"),
              "2cf24dba5fb0a30e26e83b2ac5b9e29e1b161e5c1fa7425e73043362938b9824");
    EXPECT_EQ(revision(), 3u);
}

TEST_F(File, NameMayComeInTwoParts)
{
    EXPECT_EQ(file_says(create({{"filename", "a"}, {"file_extension", "txt"}}), "filename"),
              "a.txt");
    EXPECT_EQ(file_says(create({{"filename", "b.txt"}, {"file_extension", ".txt"}}), "filename"),
              "b.txt");
    EXPECT_EQ(file_says(create({{"file_extension", "txt"}}), "filename"), "Untitled.txt");
    EXPECT_EQ(file_says(create({}), "filename"), "Untitled");
    EXPECT_EQ(file_says(create({}), "filename"), "Untitled (2)");
    EXPECT_EQ(file_says(create({{"filename", ""}}), "filename"), "Untitled (3)");
}

TEST_F(File, NameIsTakenOnce)
{
    make_file("a");
    make_folder("b");

    EXPECT_EQ(error_of("file/create", {{"filename", "a"}}), "115");
    EXPECT_EQ(error_of("file/create", {{"filename", "b"}}), "115");
    EXPECT_EQ(error_of("file/create", {{"filename", "a/b"}}), "106");
    EXPECT_EQ(error_of("file/create", {{"filename", "c"}, {"parent_key", "none"}}), "112");
    EXPECT_EQ(error_of("file/create", {{"filename", "c"}, {"mtime", "2020-02-30 00:00:00"}}),
              "106");
}

TEST_F(File, UpdateChangesWhatItIsGivenOverPost)
{
    const std::string key = make_file("a");
    const reply made = answer(
        {"POST", "/api/file/update.php?&session_token=" + sessions[ann] + "&quick_key=" + key,
         "application/x-www-form-urlencoded",
         "filename=b.mp3&description=d&tags=&privacy=private&mtime=1000"},
        state);

    EXPECT_EQ(made.http_status, 200u) << made.body;
    EXPECT_EQ(file_says(key, "filename"), "b.mp3");
    EXPECT_EQ(file_says(key, "filetype"), "audio");
    EXPECT_EQ(file_says(key, "description"), "d");
    EXPECT_EQ(file_says(key, "privacy"), "private");
}

TEST_F(File, UpdateLeavesWhatItIsNotGiven)
{
    const std::string key = make_file("a");
    const pairs all{{"quick_key", key}, {"description", "d"}, {"tags", "t"}};
    done(ann, "file/update", all);
    const std::uint64_t before = revision();

    done(ann, "file/update", {{"quick_key", key}, {"filename", ""}, {"privacy", ""}});

    EXPECT_EQ(file_says(key, "filename"), "a");
    EXPECT_EQ(file_says(key, "description"), "d");
    EXPECT_EQ(file_says(key, "tags"), "t");
    EXPECT_EQ(revision(), before);
}

TEST_F(File, UpdateRefusesWhatCannotBe)
{
    const std::string key = make_file("a");
    make_file("b");

    EXPECT_EQ(error_of("file/update", {{"quick_key", key}, {"filename", "b"}}), "115");
    EXPECT_EQ(error_of("file/update", {{"quick_key", key}, {"privacy", "none"}}), "106");
    EXPECT_EQ(error_of("file/update", {{"quick_key", "none"}, {"tags", "t"}}), "113");
    EXPECT_EQ(error_of("file/update", {}), "104");
}

TEST_F(File, DeletedOneIsGoneButItsKeyTellsItsDate)
{
    const std::string key = make_file("a");
    time += 60;

    done(ann, "file/delete", {{"quick_key", key}});

    EXPECT_EQ(names_in(""), std::vector<std::string>{});
    EXPECT_EQ(file_says(key, "delete_date"), "2023-11-14 22:14:20");
    for (const char *action :
         {"file/delete", "file/update", "file/copy", "file/move", "file/get_links"})
        EXPECT_EQ(error_of(action, {{"quick_key", key}}), "113") << action;
    EXPECT_EQ(error_of(bob, "file/get_info", {{"quick_key", key}}), "113");
    make_file("a");
}

TEST_F(File, CopyHasTheSameContentAndACountOfItsOwn)
{
    const std::string key = make_file("a.b.txt");
    fill(key, "hello");
    const std::string folder = make_folder("f");
    time += 60;

    const std::string there =
        done(ann, "file/copy", {{"quick_key", key}, {"folder_key", folder}}, "new_quickkey");
    done(ann, "file/move", {{"quick_key", key}, {"folder_key", ""}});
    const std::string here = done(ann, "file/copy", {{"quick_key", key}}, "new_quickkey");

    EXPECT_EQ(file_says(there, "filename"), "a.b.txt");
    EXPECT_EQ(file_says(there, "parent_folderkey"), folder);
    EXPECT_EQ(file_says(there, "hash"), file_says(key, "hash"));
    EXPECT_EQ(file_says(there, "created"), "2023-11-14 22:14:20");
    EXPECT_EQ(file_says(here, "filename"), "a.b (2).txt");
}

TEST_F(File, MovesUnlessItsNameIsTaken)
{
    const std::string key = make_file("a");
    const std::string folder = make_folder("f");
    const std::string full = make_folder("full");
    make_folder("a", full);

    done(ann, "file/move", {{"quick_key", key}, {"folder_key", folder}});

    EXPECT_EQ(file_says(key, "parent_folderkey"), folder);
    EXPECT_EQ(error_of("file/move", {{"quick_key", key}, {"folder_key", full}}), "115");
    EXPECT_EQ(error_of("file/move", {{"quick_key", key}, {"folder_key", "none"}}), "112");
    EXPECT_EQ(error_of("file/move", {{"quick_key", "none"}}), "113");
    EXPECT_EQ(error_of("file/move", {}), "104");
}

TEST_F(File, PublicOneCanBeReadAndCopiedByAnybodyWithItsKey)
{
    const std::string key = make_file("a");

    EXPECT_EQ(file_says(key, "permissions", nobody), "read");
    EXPECT_EQ(file_says(key, "flag", bob), "1");
    const std::string copy = done(bob, "file/copy", {{"quick_key", key}}, "new_quickkey");
    EXPECT_EQ(file_says(copy, "owner_name", bob), "bob");

    done(ann, "file/update", {{"quick_key", key}, {"privacy", "private"}});
    for (const std::string &who : {bob, nobody})
        EXPECT_EQ(error_of(who, "file/get_info", {{"quick_key", key}}), "114");
    EXPECT_EQ(error_of(bob, "file/copy", {{"quick_key", key}}), "114");
}

TEST_F(File, CopiesEndWhereTheStorageEnds)
{
    const std::string folder = make_folder("f");
    const std::string key = make_file("a", folder);
    fill(key, "123456");
    put_account_limits(store, *find_account(store, ann), {16, 0, {}});

    EXPECT_EQ(error_of("file/copy", {{"quick_key", key}}), "");
    EXPECT_EQ(error_of("file/copy", {{"quick_key", key}}), "117");
    EXPECT_EQ(error_of("folder/copy", {{"folder_key_src", folder}}), "117");
    EXPECT_EQ(done(ann, "user/get_limits", {}, "storage_used"), "12");
}
