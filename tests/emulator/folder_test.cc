// Folders: one by one and whole trees.
#include "socket_client.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

class Folder : public Tree {
protected:
    std::string error_of_update(const std::string &key, const std::string &name,
                                const std::string &value)
    {
        return error_of("folder/update", {{"folder_key", key}, {name, value}});
    }

    /** A folder with a folder and a file in it, and a file in that. */
    std::string make_tree()
    {
        const std::string top = make_folder("top");
        make_file("a", top);
        make_file("b", make_folder("inner", top));
        return top;
    }

    static std::string deep_name(int level) { return "d" + std::to_string(level); }

    std::string make_chain(int levels)
    {
        std::string at;
        for (int level = 1; level <= levels; ++level)
            at = make_folder(deep_name(level), at);
        return at;
    }
};

const std::string letters_255(255, 'x');

} // namespace

TEST_F(Folder, NewOneIsDescribed)
{
    const std::string key = done(ann, "folder/create",
                                 {{"foldername", "pho & tos"},
                                  {"mtime", "2020-01-02 03:04:05"},
                                  {"allow_duplicate_name", "no"}},
                                 "folder_key");

    const std::string info = ask("folder/get_info", {{"folder_key", key}}).body;
    const std::map<std::string, std::string> expected = {{"folderkey", key},
                                                         {"name", "pho &amp; tos"},
                                                         {"description", ""},
                                                         {"tags", ""},
                                                         {"folder_count", "0"},
                                                         {"file_count", "0"},
                                                         {"total_files", "0"},
                                                         {"total_folders", "0"},
                                                         {"total_size", "0"},
                                                         {"byte_count", "0"},
                                                         {"revision", "2"},
                                                         {"epoch", "1"},
                                                         {"shared", "no"},
                                                         {"owner_name", "ann"},
                                                         {"delete_date", ""},
                                                         {"parent_folderkey", root()},
                                                         {"custom_url", ""},
                                                         {"dropbox_enabled", "no"},
                                                         {"flag", "0"},
                                                         {"shared_by_user", "no"},
                                                         {"permissions", "write"},
                                                         {"avatar", ""},
                                                         {"privacy", "public"},
                                                         {"created", "2023-11-14 22:13:20"}};
    for (const auto &[name, value] : expected)
        EXPECT_EQ(elements(info, name), std::vector<std::string>{value}) << name;
}

TEST_F(Folder, WithoutAKeyIsTheRoot)
{
    EXPECT_EQ(folder_says("", "parent_folderkey"), "");
    EXPECT_EQ(folder_says(root(), "name"), "My files");
    EXPECT_EQ(error_of(nobody, "folder/get_info", {}), "105");
}

TEST_F(Folder, RevisionOfTheRootIsThatOfTheTree)
{
    make_folder("a");
    make_folder("b");

    EXPECT_EQ(folder_says("", "revision"), std::to_string(revision()));
}

TEST_F(Folder, CountsWhatItHolds)
{
    const std::string top = make_tree();
    fill(make_file("full", top), "12345");

    EXPECT_EQ(folder_says(top, "folder_count"), "1");
    EXPECT_EQ(folder_says(top, "file_count"), "2");
    EXPECT_EQ(folder_says(top, "total_folders"), "1");
    EXPECT_EQ(folder_says(top, "total_files"), "3");
    EXPECT_EQ(folder_says(top, "byte_count"), "5");
    EXPECT_EQ(folder_says("", "total_size"), "5");
    EXPECT_EQ(folder_says("", "byte_count"), "0");
}

TEST_F(Folder, TellsTotalsOnlyWithDetails)
{
    const std::string with = ask("folder/get_info", {{"details", "yes"}}).body;
    const std::string without = ask("folder/get_info", {{"details", "no"}}).body;

    EXPECT_EQ(elements(with, "total_size").size(), 1u);
    EXPECT_EQ(elements(without, "total_size").size(), 0u);
    EXPECT_EQ(error_of("folder/get_info", {{"details", "maybe"}}), "106");
    EXPECT_EQ(error_of("folder/get_info", {{"device_id", "x"}}), "106");
}

TEST_F(Folder, NameIsTakenOnce)
{
    make_folder("a");
    make_file("b");

    EXPECT_EQ(error_of("folder/create", {{"foldername", "a"}}), "115");
    EXPECT_EQ(error_of("folder/create", {{"foldername", "a"}, {"allow_duplicate_name", "no"}}),
              "115");
    EXPECT_EQ(error_of("folder/create", {{"foldername", "b"}}), "115");
    EXPECT_EQ(error_of("folder/create", {{"foldername", "A"}}), "");
}

TEST_F(Folder, DuplicateGetsANumberWhereItIsAllowed)
{
    make_folder("a.b");
    for (const char *expected : {"a (2).b", "a (3).b"}) {
        const std::string key =
            done(ann, "folder/create", {{"foldername", "a.b"}, {"allow_duplicate_name", "yes"}},
                 "folder_key");
        EXPECT_EQ(folder_says(key, "name"), expected);
    }
}

TEST_F(Folder, NameMustFitOnADisk)
{
    for (const std::string &name : {std::string("a/b"), std::string("."), std::string(".."),
                                    std::string("a\nb"), std::string("a\x7F"), letters_255 + "x"})
        EXPECT_EQ(error_of("folder/create", {{"foldername", name}}), "106") << name;
    EXPECT_EQ(error_of("folder/create", {{"foldername", ""}}), "104");
    EXPECT_EQ(error_of("folder/create", {{"foldername", letters_255}}), "");
    EXPECT_EQ(error_of("folder/create", {{"foldername", "..."}}), "");
}

TEST_F(Folder, NumberedNameOfTheGreatestLengthStaysThatLong)
{
    make_folder(letters_255);

    const std::string key =
        done(ann, "folder/create", {{"foldername", letters_255}, {"allow_duplicate_name", "yes"}},
             "folder_key");

    EXPECT_EQ(folder_says(key, "name"), letters_255.substr(4) + " (2)");
}

TEST_F(Folder, UpdateChangesWhatItIsGiven)
{
    const std::string key = make_folder("a");
    done(ann, "folder/update",
         {{"folder_key", key}, {"foldername", "b"}, {"description", "d"}, {"tags", "t"}});

    done(ann, "folder/update", {{"folder_key", key}, {"description", ""}, {"foldername", ""}});

    EXPECT_EQ(folder_says(key, "name"), "b") << "an empty name leaves it";
    EXPECT_EQ(folder_says(key, "description"), "") << "an empty description clears it";
    EXPECT_EQ(folder_says(key, "tags"), "t");
}

TEST_F(Folder, UpdateOfNothingIsNoChange)
{
    const std::string key = make_folder("a");
    const std::uint64_t before = revision();

    done(ann, "folder/update", {{"folder_key", key}});

    EXPECT_EQ(revision(), before);
}

TEST_F(Folder, UpdateRefusesWhatCannotBe)
{
    const std::string key = make_folder("a");
    make_folder("b");

    EXPECT_EQ(error_of_update(key, "foldername", "b"), "115");
    EXPECT_EQ(error_of_update(key, "foldername", "a"), "") << "its own name is free for it";
    EXPECT_EQ(error_of_update(key, "foldername", "x/y"), "106");
    EXPECT_EQ(error_of_update(key, "privacy", "secret"), "106");
    EXPECT_EQ(error_of_update(key, "mtime", "yesterday"), "106");
    EXPECT_EQ(error_of_update(key, "tags", std::string(4097, 't')), "106");
    EXPECT_EQ(error_of_update("none", "tags", "t"), "112");
    EXPECT_EQ(error_of_update(root(), "tags", "t"), "121");
    EXPECT_EQ(error_of("folder/update", {}), "104");
}

TEST_F(Folder, PrivacyReachesTheInsideOnlyWhenAsked)
{
    const std::string top = make_folder("top");
    const std::string inner = make_folder("inner", top);
    const std::string file = make_file("a", inner);

    done(ann, "folder/update", {{"folder_key", top}, {"privacy", "private"}});
    EXPECT_EQ(folder_says(top, "privacy"), "private");
    EXPECT_EQ(folder_says(inner, "privacy"), "public");

    done(ann, "folder/update",
         {{"folder_key", top}, {"privacy", "private"}, {"privacy_recursive", "yes"}});
    EXPECT_EQ(folder_says(inner, "privacy"), "private");
    EXPECT_EQ(file_says(file, "privacy"), "private");
}

TEST_F(Folder, NewEntriesInheritItsPrivacy)
{
    const std::string top = make_folder("top");
    done(ann, "folder/update", {{"folder_key", top}, {"privacy", "private"}});

    EXPECT_EQ(folder_says(make_folder("f", top), "privacy"), "private");
    EXPECT_EQ(file_says(make_file("a", top), "privacy"), "private");
}

TEST_F(Folder, PrivateOneIsForItsOwnerAlone)
{
    const std::string key = make_folder("a");
    done(ann, "folder/update", {{"folder_key", key}, {"privacy", "private"}});

    for (const std::string &who : {bob, nobody})
        for (const char *action : {"folder/get_info", "1.0/folder/get_content"})
            EXPECT_EQ(error_of(who, action, {{"folder_key", key}}), "114") << action;
}

TEST_F(Folder, PublicOneShowsOthersWhatIsPublicInIt)
{
    const std::string top = make_folder("top");
    const std::string inner = make_folder("inner", top);
    make_file("a", top);
    done(ann, "folder/update", {{"folder_key", inner}, {"privacy", "private"}});

    for (const std::string &who : {bob, nobody}) {
        EXPECT_EQ(names_in(top, who), std::vector<std::string>{"a"});
        EXPECT_EQ(folder_says(top, "folder_count", who), "0");
        EXPECT_EQ(folder_says(top, "permissions", who), "read");
    }
}

TEST_F(Folder, CanBeChangedByItsOwnerAlone)
{
    const std::string key = make_folder("a");
    const std::string file = make_file("f");

    EXPECT_EQ(error_of(bob, "folder/update", {{"folder_key", key}, {"tags", "t"}}), "114");
    EXPECT_EQ(error_of(bob, "folder/delete", {{"folder_key", key}}), "114");
    EXPECT_EQ(error_of(bob, "folder/move", {{"folder_key_src", key}}), "114");
    EXPECT_EQ(error_of(bob, "folder/copy", {{"folder_key_src", key}}), "114");
    EXPECT_EQ(error_of(bob, "folder/create", {{"foldername", "x"}, {"parent_key", key}}), "114");
    EXPECT_EQ(error_of(bob, "file/update", {{"quick_key", file}, {"tags", "t"}}), "114");
    EXPECT_EQ(error_of(bob, "file/delete", {{"quick_key", file}}), "114");
    EXPECT_EQ(error_of(bob, "file/move", {{"quick_key", file}}), "114");
    EXPECT_EQ(error_of(bob, "file/create", {{"parent_key", key}}), "114");
    EXPECT_EQ(revision(), 3u);
    EXPECT_EQ(revision(bob), 1u);
}

TEST_F(Folder, DeletedTreeIsGoneButItsKeysTellItsDate)
{
    const std::string top = make_tree();
    const std::string inner =
        element(ask("1.0/folder/get_content", {{"folder_key", top}}).body, "folderkey");
    time += 60;

    done(ann, "folder/delete", {{"folder_key", top}});

    EXPECT_EQ(names_in(""), std::vector<std::string>{});
    for (const std::string &key : {top, inner}) {
        EXPECT_EQ(folder_says(key, "delete_date"), "2023-11-14 22:14:20");
        EXPECT_EQ(error_of("1.0/folder/get_content", {{"folder_key", key}}), "112");
        EXPECT_EQ(error_of("folder/update", {{"folder_key", key}, {"tags", "t"}}), "112");
        EXPECT_EQ(error_of("folder/delete", {{"folder_key", key}}), "112");
        EXPECT_EQ(error_of("folder/copy", {{"folder_key_src", key}}), "112");
        EXPECT_EQ(error_of("folder/create", {{"foldername", "x"}, {"parent_key", key}}), "112");
        EXPECT_EQ(error_of(bob, "folder/get_info", {{"folder_key", key}}), "112");
    }
    EXPECT_EQ(folder_says("", "total_files"), "0");
    EXPECT_EQ(error_of("folder/create", {{"foldername", "top"}}), "") << "its name is free again";
}

TEST_F(Folder, RootStays)
{
    EXPECT_EQ(error_of("folder/delete", {{"folder_key", root()}}), "121");
    EXPECT_EQ(error_of("folder/move", {{"folder_key_src", root()}}), "121");
    EXPECT_EQ(error_of("folder/copy", {{"folder_key_src", root()}}), "121");
    EXPECT_EQ(error_of("folder/delete", {}), "104");
}

TEST_F(Folder, CopyIsAWholeTreeOfItsOwn)
{
    const std::string top = make_tree();
    done(ann, "folder/update", {{"folder_key", top}, {"tags", "t"}, {"privacy", "private"}});

    const std::string copy = done(ann, "folder/copy", {{"folder_key_src", top}}, "new_folderkey");

    EXPECT_EQ(folder_says(copy, "name"), "top (2)");
    EXPECT_EQ(folder_says(copy, "tags"), "t");
    EXPECT_EQ(folder_says(copy, "privacy"), "private");
    EXPECT_EQ(names_in(copy), names_in(top));
    done(ann, "folder/delete", {{"folder_key", top}});
    EXPECT_EQ(folder_says(copy, "total_files"), "2");
    EXPECT_EQ(folder_says(copy, "total_folders"), "1");
}

TEST_F(Folder, MovesWithAllThatItHolds)
{
    const std::string top = make_tree();
    const std::string target = make_folder("target");
    const std::uint64_t before = revision();

    done(ann, "folder/move", {{"folder_key_src", top}, {"folder_key_dst", target}});

    EXPECT_EQ(folder_says(top, "parent_folderkey"), target);
    EXPECT_EQ(folder_says(target, "total_files"), "2");
    EXPECT_EQ(revision(), before + 1) << "what it holds did not change";
    done(ann, "folder/move", {{"folder_key_src", top}});
    EXPECT_EQ(folder_says(top, "parent_folderkey"), root()) << "without a destination";
}

TEST_F(Folder, CannotBePutIntoItself)
{
    const std::string top = make_folder("top");
    const std::string inner = make_folder("inner", make_folder("middle", top));

    for (const char *action : {"folder/move", "folder/copy"})
        for (const std::string &into : {top, inner})
            EXPECT_EQ(error_of(action, {{"folder_key_src", top}, {"folder_key_dst", into}}), "120")
                << action;
}

TEST_F(Folder, MoveIntoATakenNameIsRefused)
{
    const std::string target = make_folder("target");
    make_file("a", target);

    EXPECT_EQ(
        error_of("folder/move", {{"folder_key_src", make_folder("a")}, {"folder_key_dst", target}}),
        "115");
}

TEST_F(Folder, NestsToTheLimitAndNoFurther)
{
    const std::string deepest = make_chain(100);

    EXPECT_EQ(error_of("folder/create", {{"foldername", "x"}, {"parent_key", deepest}}), "116");
    EXPECT_EQ(error_of("file/create", {{"filename", "x"}, {"parent_key", deepest}}), "");
    const std::string pair = make_folder("pair");
    make_folder("x", pair);
    const std::string parent = folder_says(deepest, "parent_folderkey");
    for (const char *action : {"folder/move", "folder/copy"}) {
        EXPECT_EQ(error_of(action, {{"folder_key_src", pair}, {"folder_key_dst", parent}}), "116");
        EXPECT_EQ(error_of(action, {{"folder_key_src", make_folder(action + 7)},
                                    {"folder_key_dst", parent}}),
                  "");
    }
}
