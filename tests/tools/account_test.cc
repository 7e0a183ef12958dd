// The commands on the account, with the library and the local service, one behaviour at a time.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "emulator_account.h"

namespace quillmere_test {
namespace {

using json = nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::MatchesRegex;

using words = std::vector<std::string>;

class Account : public emulator_account {
protected:
    Account() { sign_in(); }

    std::string key_of(const std::string &path) const
    {
        return result_of({"stat", path}).at("key");
    }
};

TEST_F(Account, IsToldInGroups)
{
    const json told = result_of({"whoami"});
    const outcome shown = home.run({"whoami"});

    EXPECT_EQ(told.at("user").at("email"), account_email);
    EXPECT_EQ(told.at("facebook").at("linked"), "yes");
    EXPECT_EQ(told.at("twitter").at("linked"), "no");
    EXPECT_TRUE(told.at("twitter").at("screen_name").is_null());
    EXPECT_EQ(told.at("limits").at("storage_used"), 0);
    EXPECT_EQ(told.at("limits").size(), 13U);
    EXPECT_EQ(told.at("tree").at("revision"), 1);
    EXPECT_THAT(shown.out, HasSubstr(std::string("E-mail                    ") + account_email));
    EXPECT_THAT(shown.out, HasSubstr("\nRevision                  1\n"));
    EXPECT_THAT(shown.out, testing::Not(HasSubstr("Twitter screen name")));
}

TEST_F(Account, IsListedInFullBeyondOneChunk)
{
    const std::string many = home.folder().path_of("many");
    command make;
    make.program = "sh";
    make.arguments = {"-c", "mkdir \"$0\" && cd \"$0\" && touch $(seq 1001 1205)", many};
    ASSERT_EQ(run(make).exit_status, 0);
    emulator_command(
        {"put-content", "--account", account_email, "--path", "/many", "--from", many});

    const words names = listed_names("/many");

    ASSERT_EQ(names.size(), 205U);
    EXPECT_EQ(names.front(), "1001");
    EXPECT_EQ(names.back(), "1205");
    EXPECT_EQ(result_of({"stat", "/many/1205"}).at("name"), "1205");
    EXPECT_EQ(home.run({"stat", "/many/1206"}).exit_status, 3);
}

TEST_F(Account, IsListedForPeople)
{
    result_of({"mkdir", "/b"});
    put_content("/a.txt", "12345");

    EXPECT_EQ(home.run({"ls"}).out, "b/\na.txt\n");
    EXPECT_EQ(home.run({"ls", "/a.txt"}).out, "a.txt\n");
    EXPECT_EQ(home.run({"ls", "/b"}).out, "");
    EXPECT_THAT(home.run({"ls", "-l"}).out,
                MatchesRegex("Kind    Size  Created              Privacy  Key              Name\n"
                             "folder     -  [-0-9]+ [:0-9]+  public   [a-z0-9]+    b\n"
                             "file       5  [-0-9]+ [:0-9]+  public   [a-z0-9]+  a.txt\n"));
}

TEST_F(Account, IsFoundByPathAndByKey)
{
    result_of({"mkdir", "-p", "/a/b"});
    result_of({"create", "/a/b/c"});
    const std::string key = "key:" + key_of("/a");

    EXPECT_EQ(result_of({"stat", key}).at("kind"), "folder");
    EXPECT_EQ(key_of(key + "/b/c"), key_of("/a/b/c"));
    EXPECT_EQ(result_of({"stat", "key:" + key_of("a/b/c")}).at("kind"), "file");
    EXPECT_EQ(result_of({"stat", "/"}).at("total_files"), 1);
}

TEST_F(Account, TakesNamesOfEveryCharacter)
{
    for (const char *name : {"[a,b]", "a&b=c?d#e %41+", "\xc3\xa4\xe6\x97\xa5\xf0\x9f\x98\x80",
                             "'\"<>\\", "{}", "%%", "key:x", "-r"}) {
        const std::string path = std::string("/") + name;
        EXPECT_EQ(result_of({"create", path}).at("path"), path);
        EXPECT_EQ(result_of({"stat", path}).at("name"), name);
        result_of({"rm", path});
    }
    EXPECT_THAT(listed_names("/"), ElementsAre());
}

TEST_F(Account, GetsAFolderOnceUnlessAsked)
{
    EXPECT_EQ(result_of({"mkdir", "/a"}).at("created"), true);

    error_of({"mkdir", "/a"}, 3);
    EXPECT_EQ(result_of({"mkdir", "-p", "/a"}).at("created"), false);
    EXPECT_EQ(result_of({"mkdir", "-p", "/a/b/c/"}).at("created"), true);
    error_of({"mkdir", "/a/x/y"}, 3);
    result_of({"create", "/f"});
    error_of({"mkdir", "-p", "/f"}, 3);
    error_of({"mkdir", "-p", "/f/g"}, 3);
    EXPECT_THAT(listed_names("/a"), ElementsAre("b"));
}

TEST_F(Account, GetsAnEmptyFileOnce)
{
    const json made = result_of({"create", "/a", "--time", "2020-02-03 04:05:06"});

    EXPECT_EQ(made.at("kind"), "file");
    error_of({"create", "/a"}, 3);
    error_of({"create", "/b/"}, 2);
    error_of({"create", "/x/y"}, 3);
    const json stored = dump_of(account_email).at("root").at("files");
    ASSERT_EQ(stored.size(), 1U);
    EXPECT_EQ(stored.at(0).at("key"), made.at("key"));
    EXPECT_EQ(stored.at(0).at("mtime"), "2020-02-03 04:05:06");
}

TEST_F(Account, LosesAFolderOnlyOnPurpose)
{
    result_of({"mkdir", "-p", "/a/b"});

    EXPECT_THAT(std::string(error_of({"rm", "/a"}, 2).at("advice")), HasSubstr("--recursive"));
    EXPECT_THAT(listed_names("/"), ElementsAre("a"));
    result_of({"rm", "-r", "/a"});
    EXPECT_THAT(listed_names("/"), ElementsAre());
}

TEST_F(Account, MovesIntoAFolderOrToANewName)
{
    result_of({"mkdir", "/d"});
    result_of({"mkdir", "/e"});
    result_of({"create", "/f"});
    const std::string key = key_of("/f");

    EXPECT_EQ(result_of({"mv", "/f", "/d"}).at("path"), "/d/f");
    EXPECT_EQ(result_of({"mv", "/d/f", "/d/g"}).at("path"), "/d/g");
    EXPECT_EQ(result_of({"mv", "/d/g", "/e/h"}).at("path"), "/e/h");
    EXPECT_EQ(key_of("/e/h"), key);
    EXPECT_EQ(result_of({"mv", "key:" + key, "/"}).at("path"), "/h");
    EXPECT_EQ(result_of({"mv", "/e", "/d/"}).at("path"), "/d/e");
    EXPECT_EQ(result_of({"mv", "/d", "/c/"}).at("path"), "/c/");
    EXPECT_THAT(listed_names("/c"), ElementsAre("e"));
    EXPECT_THAT(listed_names("/"), ElementsAre("c", "h"));
}

TEST_F(Account, NeverMovesOverWhatIsThere)
{
    result_of({"mkdir", "/d"});
    result_of({"create", "/f"});
    result_of({"create", "/d/f"});

    error_of({"mv", "/f", "/d/f"}, 3);
    error_of({"mv", "/f", "/f"}, 3);
    error_of({"mv", "/d/f", "/d"}, 3);
    error_of({"mv", "/f", "/new/"}, 3);
    error_of({"mv", "/f", "/x/y"}, 3);
    EXPECT_EQ(error_of({"mv", "/f", "/d"}, 3).at("code"), 115);
    EXPECT_EQ(error_of({"mv", "/d", "/d"}, 3).at("code"), 120);
    EXPECT_THAT(listed_names("/"), ElementsAre("d", "f"));
}

TEST_F(Account, CopiesAFolderOnlyOnPurpose)
{
    result_of({"mkdir", "-p", "/a/b"});
    result_of({"create", "/f"});

    error_of({"cp", "/a", "/c"}, 2);
    const json copy = result_of({"cp", "-r", "/a", "/c"});
    EXPECT_EQ(copy.at("key"), key_of("/c"));
    EXPECT_THAT(listed_names("/c"), ElementsAre("b"));
    EXPECT_EQ(result_of({"cp", "/f", "/c"}).at("path"), "/c/f");
    EXPECT_EQ(result_of({"cp", "/f", "/c/g"}).at("path"), "/c/g");
    EXPECT_THAT(listed_names("/c"), ElementsAre("b", "f", "g"));
    error_of({"cp", "/f", "/c/g"}, 3);
}

TEST_F(Account, KeepsWhatIsNotSet)
{
    result_of({"mkdir", "/d"});
    result_of({"create", "/f"});
    for (const std::string path : {"/d", "/f"}) {
        result_of({"set", path, "--description", "words", "--tags", "a b"});
        result_of({"set", path, "--tags", "", "--privacy", "private"});
        const json told = result_of({"stat", path});
        EXPECT_EQ(told.at("description"), "words");
        EXPECT_TRUE(told.at("tags").is_null());
        EXPECT_EQ(told.at("privacy"), "private");
        result_of({"set", path, "--privacy", "public"});
        EXPECT_EQ(result_of({"stat", path}).at("privacy"), "public");
    }
}

TEST_F(Account, GivesAFoldersPrivacyToWhatItHoldsOnlyWhenAsked)
{
    result_of({"mkdir", "/d"});
    result_of({"create", "/d/f"});

    result_of({"set", "/d", "--privacy", "private"});
    EXPECT_EQ(result_of({"stat", "/d/f"}).at("privacy"), "public");
    result_of({"set", "/d", "--privacy", "private", "-r"});
    EXPECT_EQ(result_of({"stat", "/d/f"}).at("privacy"), "private");
    error_of({"set", "/d/f", "--privacy", "public", "-r"}, 2);
}

TEST_F(Account, HasLinksOfFilesAlone)
{
    result_of({"mkdir", "/d"});
    put_content("/f.txt", "x");

    error_of({"links", "/d"}, 3);
    const json links = result_of({"links", "/f.txt", "--type", "direct_download"}).at("links");
    ASSERT_EQ(links.size(), 1U);
    EXPECT_EQ(links.at(0).at("type"), "direct_download");
    EXPECT_EQ(home.run({"links", "/f.txt", "--download"}).out,
              links.at(0).at("link").get<std::string>() + "\n");
    EXPECT_EQ(result_of({"links", "/f.txt", "--download"}).at("url"), links.at(0).at("link"));
}

TEST_F(Account, TellsItsChangesSinceARevision)
{
    result_of({"mkdir", "/d"});
    const json before = result_of({"changes"});
    result_of({"create", "/d/f"});
    result_of({"rm", "-r", "/d"});

    const json after = result_of({"changes", "--since", before.at("device_revision").dump()});

    EXPECT_EQ(before.at("changes").size(), 1U);
    EXPECT_EQ(before.at("changes").at(0).at("change"), "updated");
    EXPECT_EQ(after.at("changes").size(), 2U);
    for (const json &each : after.at("changes"))
        EXPECT_EQ(each.at("change"), "deleted");
    EXPECT_EQ(error_of({"changes", "--since", "1000"}, 3).at("code"), 106);
    EXPECT_THAT(home.run({"changes", "--since", before.at("device_revision").dump()}).out,
                MatchesRegex("Revision  [0-9]+\n\nRevision  Change   Kind    Key +In folder +Name\n"
                             "( +[0-9]+  deleted  (file  |folder)  [a-z0-9]+ +[a-z0-9]+ +-\n)+"));
}

TEST_F(Account, HoldsAForeignFolderBesideItsOwnOfThatName)
{
    add_account("other@example.org");
    program_home theirs;
    theirs.environment["QUILLMERE_EMULATOR"] = ready_file;
    theirs.run({"login", "other@example.org", "--password-stdin"},
               std::string(account_password) + "\n");
    const json shared = json::parse(theirs.run({"mkdir", "/shared", "--json"}).out);
    const std::string by_key = "key:" + shared.at("key").get<std::string>();
    result_of({"mkdir", "/shared"});

    result_of({"attach", by_key});

    EXPECT_THAT(std::string(error_of({"rm", "-r", "/shared"}, 2).at("advice")), HasSubstr(by_key));
    error_of({"detach", "/shared"}, 2);
    EXPECT_EQ(error_of({"attach", by_key}, 3).at("code"), 122);
    result_of({"detach", by_key});
    EXPECT_EQ(error_of({"detach", by_key}, 3).at("code"), 122);
    result_of({"rm", "-r", "/shared"});
}

TEST_F(Account, TellsInJsonWhatIsNotThere)
{
    for (const words &arguments :
         {words{"ls", "/no"}, words{"stat", "/no"}, words{"mkdir", "/no/no"},
          words{"create", "/no/no"}, words{"rm", "/no"}, words{"mv", "/no", "/"},
          words{"cp", "/no", "/"}, words{"set", "/no", "--tags", "x"}, words{"links", "/no"},
          words{"attach", "key:no"}, words{"detach", "/no"}})
        EXPECT_EQ(error_of(arguments, 3).at("kind"), "refused") << arguments.front();
}

} // namespace
} // namespace quillmere_test
