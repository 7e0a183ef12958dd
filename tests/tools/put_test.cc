// Uploading from the command line, as a user would.
#include <filesystem>

#include <gmock/gmock.h>

#include "transfer_account.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

using words = std::vector<std::string>;

class Put : public transfer_account {
protected:
    /** Uploading writes to standard error what a person should know, with --json too. */
    nlohmann::json error_in(words arguments, int exit_code) const
    {
        arguments.emplace_back("--json");
        const outcome ended = home.run(arguments);
        EXPECT_EQ(ended.exit_status, exit_code) << ended.out << ended.err;
        return nlohmann::json::parse(ended.out, nullptr, false).value("error", nlohmann::json());
    }
};

} // namespace

TEST_F(Put, SendsAFileToTheRootUnderItsName)
{
    const outcome ended = done({"put", local("a.txt", "some text")});

    EXPECT_EQ(ended.out, "Uploaded " + home.folder().path_of("sources/a.txt") + " to /a.txt\n");
    EXPECT_EQ(remote_sha256("/a.txt"), sha256_of("some text"));
}

TEST_F(Put, SaysThatTheUploadIsUnencrypted)
{
    const std::string warning =
        "quillmere: uploads go to the unencrypted address http://127.0.0.1:";

    EXPECT_THAT(done({"put", local("a.txt", "x")}).err, HasSubstr(warning));
    EXPECT_THAT(done({"put", "--quiet", local("b.txt", "x")}).err, HasSubstr(warning));
}

TEST_F(Put, SendsNothingUnencryptedToAnotherMachine)
{
    const std::string ready = home.folder().write(
        "other.json", R"({"https_url": ")" + base +
                          R"(", "http_url": "http://198.51.100.1:80", "ca_file": ")" + data +
                          R"(/ca.pem"})");

    const outcome ended = home.run({"put", "--emulator", ready, local("a.txt", "x")});

    EXPECT_EQ(ended.exit_status, 2) << ended.err;
    EXPECT_THAT(ended.err, HasSubstr("198.51.100.1"));
    EXPECT_EQ(listed_names("/"), words{});
}

TEST_F(Put, TakesAFolderOrANewNameAsDestination)
{
    done({"mkdir", "/photos"});
    const std::string file = local("a.jpg", "picture");

    done({"put", file, "/photos"});
    done({"put", file, "/photos/b.jpg"});
    done({"put", file, file, local("c.jpg", "third"), "/photos/"});

    EXPECT_THAT(listed_names("/photos"), ElementsAre("a.jpg", "b.jpg", "c.jpg"));
    EXPECT_EQ(stored_contents().size(), 2u) << "the same content is stored once";
}

TEST_F(Put, SendsANewRevisionOfAFileThatIsThere)
{
    done({"put", local("a.txt", "old"), "/"});
    const nlohmann::json before = result_of({"stat", "/a.txt"});

    const outcome ended = done({"put", local("a.txt", "newer")});

    const nlohmann::json after = result_of({"stat", "/a.txt"});
    EXPECT_THAT(ended.out, HasSubstr("as a new revision of /a.txt"));
    EXPECT_EQ(after.at("key"), before.at("key"));
    EXPECT_GT(after.at("revision"), before.at("revision"));
    EXPECT_EQ(after.at("hash"), sha256_of("newer"));
    EXPECT_THAT(listed_names("/"), ElementsAre("a.txt"));
}

TEST_F(Put, SendsNothingWhenTheSameIsThere)
{
    const std::string file = local("a.txt", "same");
    done({"put", file});
    const nlohmann::json before = result_of({"stat", "/a.txt"});

    EXPECT_EQ(done({"put", file}).out, "/a.txt is up to date\n");

    EXPECT_EQ(result_of({"stat", "/a.txt"}), before);
}

TEST_F(Put, SendsStandardInput)
{
    done({"put", "-", "/from-a-pipe"}, "what came in");
    done({"update", "-", "/from-a-pipe"}, "what came later");

    EXPECT_EQ(remote_sha256("/from-a-pipe"), sha256_of("what came later"));
    EXPECT_EQ(home.run({"put", "-"}, "x").exit_status, 2) << "it has no name";
    EXPECT_EQ(home.run({"put", "-", local("a", "x"), "/"}, "x").exit_status, 2);
}

TEST_F(Put, LeavesNoTemporaryFileBehind)
{
    const std::string temporary = home.folder().path_of("temporary");
    fs::create_directory(temporary);
    home.environment["TMPDIR"] = temporary;

    done({"put", "-", "/a"}, "what came in");

    EXPECT_TRUE(fs::is_empty(temporary));
}

TEST_F(Put, SendsAFolderWithAllThatItHolds)
{
    local("tree/a.txt", "a");
    local("tree/deep/er/b.txt", "b");
    const std::string tree = home.folder().path_of("sources/tree");
    fs::create_directory(tree + "/empty");

    const outcome ended = done({"put", "-r", tree});

    EXPECT_EQ(ended.out, "Uploaded 2 files (2 B)\n");
    EXPECT_THAT(listed_names("/tree"), ElementsAre("deep", "empty", "a.txt"));
    EXPECT_EQ(remote_sha256("/tree/deep/er/b.txt"), sha256_of("b"));
    EXPECT_EQ(home.run({"put", tree}).exit_status, 2) << "without -r";
}

TEST_F(Put, AddsToAFolderThatIsThere)
{
    local("tree/same", "same");
    local("tree/changed", "old");
    const std::string tree = home.folder().path_of("sources/tree");
    done({"put", "-r", tree});
    local("tree/changed", "new");
    local("tree/added", "added");

    const nlohmann::json files = result_of({"put", "-r", tree}).at("files");

    std::map<std::string, std::string> outcomes;
    for (const auto &each : files)
        outcomes[each.at("target")] = each.at("outcome");
    EXPECT_EQ(outcomes, (std::map<std::string, std::string>{{"/tree/added", "created"},
                                                            {"/tree/changed", "revised"},
                                                            {"/tree/same", "unchanged"}}));
}

TEST_F(Put, GivesAFolderANewName)
{
    local("tree/a.txt", "a");

    done({"put", "-r", home.folder().path_of("sources/tree/"), "/other"});

    EXPECT_THAT(listed_names("/other"), ElementsAre("a.txt"));
}

TEST_F(Put, GoesOnWhenOneOfManyFails)
{
    local("tree/a.txt", "a");
    local("tree/bad\x01name", "b");
    local("tree/c.txt", "c");
    const std::string tree = home.folder().path_of("sources/tree");
    fs::create_symlink("a.txt", tree + "/link");

    const outcome ended = home.run({"put", "-r", tree});

    EXPECT_EQ(ended.exit_status, 8) << ended.err;
    EXPECT_THAT(ended.err, HasSubstr("bad\\u{1}name failed: 106"));
    EXPECT_THAT(ended.err, HasSubstr("link is a link, which is left out"));
    EXPECT_THAT(ended.err, HasSubstr("uploaded 2 files (2 B), but 2 files failed ("));
    EXPECT_THAT(listed_names("/tree"), ElementsAre("a.txt", "c.txt"));
}

TEST_F(Put, RefusesWhatCannotBeUploaded)
{
    const std::string file = local("a.txt", "x");
    done({"put", file, "/a.txt"});
    done({"mkdir", "/folder"});

    EXPECT_EQ(error_in({"put", home.folder().path_of("missing")}, 9).at("kind"), "local_file");
    EXPECT_EQ(error_in({"put", "/dev/null"}, 9).at("kind"), "local_file");
    EXPECT_EQ(error_in({"put", file, "/missing/a.txt"}, 3).at("kind"), "refused");
    EXPECT_EQ(error_in({"put", file, "/missing/"}, 3).at("kind"), "refused");
    EXPECT_EQ(error_in({"put", file, file, "/a.txt"}, 3).at("kind"), "refused");
    EXPECT_EQ(error_in({"put", "-r", home.folder().path_of("sources"), "/a.txt"}, 3).at("kind"),
              "refused");
    EXPECT_EQ(error_in({"put", local("folder", "x")}, 3).at("code"), 115)
        << "a file cannot take the name of a folder";
    EXPECT_THAT(listed_names("/"), ElementsAre("folder", "a.txt"));
}

TEST_F(Put, IsRefusedWithoutRoom)
{
    emulator_command({"add-account", "--email", "small@example.org", "--password-file", "-",
                      "--base-storage", "1000"},
                     "secret\n");
    done({"login", "small@example.org", "--password-stdin"}, "secret\n");

    const nlohmann::json error = error_in({"put", local("large", some_bytes(1'000'000))}, 3);

    EXPECT_EQ(error.at("code"), 117);
    EXPECT_EQ(stored_contents().size(), 0u);
}

TEST_F(Put, ShowsALineForEachFileUnlessItIsQuiet)
{
    const std::string file = local("a.txt", std::string(2048, 'x'));

    EXPECT_THAT(done({"put", file, "/a"}).err, HasSubstr("quillmere: a  2.0 KiB  in 0:0"));
    EXPECT_THAT(done({"put", "-q", file, "/b"}).err, Not(HasSubstr("2.0 KiB")));
}

TEST_F(Put, KeepsTheSessionOutOfItsLog)
{
    const std::string token =
        nlohmann::json::parse(content_of(home.session_path())).at("session_token");

    const outcome ended = done({"put", "--verbose", local("a.txt", "x")});

    EXPECT_THAT(ended.err, HasSubstr("upload url: http://127.0.0.1:"));
    EXPECT_THAT(ended.err, Not(HasSubstr(token)));
}

TEST_F(Put, AsAnUpdateNeedsAFileThatIsThere)
{
    const std::string file = local("a.txt", "x");
    done({"mkdir", "/folder"});

    EXPECT_EQ(error_in({"update", file, "/missing"}, 3).at("kind"), "refused");
    EXPECT_EQ(error_in({"update", file, "/folder"}, 3).at("kind"), "refused");
    done({"put", file});
    EXPECT_EQ(done({"update", local("b.txt", "y"), "/a.txt"}).exit_status, 0);
    EXPECT_EQ(remote_sha256("/a.txt"), sha256_of("y"));
}

} // namespace quillmere_test
