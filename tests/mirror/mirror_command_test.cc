// The mirror as a user runs it, against the emulator.
#include <csignal>
#include <filesystem>
#include <map>

#include <sys/stat.h>

#include <gmock/gmock.h>

#include "fake_download.h"
#include "transfer_account.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using json = nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::UnorderedElementsAre;

/** Everything below a folder, and what would show that it was touched. */
std::map<std::string, std::vector<std::int64_t>> facts_below(const std::string &top)
{
    std::map<std::string, std::vector<std::int64_t>> found;
    struct stat facts = {};
    for (const auto &each : fs::recursive_directory_iterator(top)) {
        EXPECT_EQ(::lstat(each.path().c_str(), &facts), 0) << each.path();
        found[each.path()] = {static_cast<std::int64_t>(facts.st_ino), facts.st_mode, facts.st_size,
                              facts.st_mtim.tv_sec, facts.st_mtim.tv_nsec};
    }
    EXPECT_EQ(::stat(top.c_str(), &facts), 0);
    found[top] = {facts.st_mtim.tv_sec, facts.st_mtim.tv_nsec};
    return found;
}

class Mirror : public transfer_account {
protected:
    std::string path(const std::string &name = {}) const
    {
        return home.folder().path_of("copy" + (name.empty() ? "" : "/" + name));
    }

    outcome mirrored(const std::string &remote = "/") const
    {
        return done({"mirror", remote, path()});
    }

    /** What a run did, "moved new old" in its order. */
    std::vector<std::string> steps(const std::vector<std::string> &more = {}) const
    {
        std::vector<std::string> told;
        std::vector<std::string> arguments = {"mirror", "/", path(), "--quiet"};
        arguments.insert(arguments.end(), more.begin(), more.end());
        const json result = result_of(arguments);
        for (const json &each : result.at("steps")) {
            std::string step = each.at("action");
            for (const char *name : {"path", "former_path"})
                if (!each.at(name).is_null())
                    step += " " + each.at(name).get<std::string>();
            told.push_back(step);
        }
        return told;
    }

    /** A run that is killed at what the variable says. */
    void run_killed(const std::string &variable, const std::string &value) const
    {
        command what = home.with({"mirror", "/", path(), "--retries", "0"});
        what.program = QUILLMERE_KILLED_PROGRAM;
        what.environment[variable] = value;
        ASSERT_EQ(run(what).signal, SIGKILL);
    }

    /** The paths in the copy, but for the mirror's own. */
    std::vector<std::string> paths() const
    {
        std::vector<std::string> found;
        for (auto each = fs::recursive_directory_iterator(path());
             each != fs::recursive_directory_iterator(); ++each) {
            if (each->path().filename() == ".quillmere-mirror")
                each.disable_recursion_pending();
            else
                found.push_back(fs::relative(each->path(), path()));
        }
        std::sort(found.begin(), found.end());
        return found;
    }

    /** What a dry run tells. It leaves the copy as it is, the mirror's own folder too. */
    std::vector<std::string> foreseen_steps() const
    {
        const auto before = facts_below(path());
        std::vector<std::string> told = steps({"--dry-run"});
        EXPECT_EQ(facts_below(path()), before);
        return told;
    }

    void write_here(const std::string &name, const std::string &bytes) const
    {
        home.folder().write("copy/" + name, bytes);
    }
};

using HostileService = fake_download;

} // namespace

TEST_F(Mirror, BringsAllThatAFolderHolds)
{
    put_content("/photos/a.txt", "a");
    put_content("/photos/deep/er/b.txt", "b");
    done({"mkdir", "/photos/empty"});
    done({"create", "/photos/nothing"});
    put_content("/other", "other");

    const outcome ended = mirrored("/photos");

    EXPECT_THAT(ended.out, HasSubstr("made 3 folders, fetched 3 files (2 B)"));
    EXPECT_THAT(paths(),
                ElementsAre("a.txt", "deep", "deep/er", "deep/er/b.txt", "empty", "nothing"));
    EXPECT_EQ(content_of(path("deep/er/b.txt")), "b");
    EXPECT_EQ(content_of(path("nothing")), "");
}

TEST_F(Mirror, DoesNothingWhenNothingChanged)
{
    put_content("/a.txt", "a");
    mirrored();

    EXPECT_EQ(mirrored().out, path() + " is up to date\n");
    EXPECT_EQ(result_of({"stat", "/a.txt"}).at("downloads"), 1);
}

TEST_F(Mirror, FetchesOnlyWhatChanged)
{
    put_content("/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    put_content("/b.txt", "b2");
    put_content("/new/c.txt", "c");

    EXPECT_THAT(steps(), ElementsAre("made new", "fetched b.txt", "fetched new/c.txt"));

    EXPECT_EQ(content_of(path("b.txt")), "b2");
    EXPECT_EQ(content_of(path("new/c.txt")), "c");
    EXPECT_EQ(result_of({"stat", "/a.txt"}).at("downloads"), 1);
}

TEST_F(Mirror, FollowsMovesAndNewNamesWithoutFetching)
{
    put_content("/one/a.txt", "a");
    put_content("/one/b.txt", "b");
    done({"mkdir", "/two"});
    mirrored();
    done({"mv", "/one", "/two"});
    done({"mv", "/two/one/a.txt", "/c.txt"});

    EXPECT_THAT(steps(), ElementsAre("moved two/one one", "moved c.txt one/a.txt"));

    EXPECT_THAT(paths(), ElementsAre("c.txt", "two", "two/one", "two/one/b.txt"));
}

TEST_F(Mirror, FollowsNamesThatAreTraded)
{
    put_content("/one/a.txt", "a");
    put_content("/two/a.txt", "b");
    mirrored();
    done({"mv", "/one", "/three"});
    done({"mv", "/two", "/one"});
    done({"mv", "/three", "/two"});

    mirrored();

    EXPECT_EQ(content_of(path("one/a.txt")), "b");
    EXPECT_EQ(content_of(path("two/a.txt")), "a");
    EXPECT_THAT(paths(), ElementsAre("one", "one/a.txt", "two", "two/a.txt"));
}

TEST_F(Mirror, FollowsAFolderThatChangesSidesWithTheOneItIsIn)
{
    put_content("/outer/inner/a.txt", "a");
    mirrored();
    done({"mv", "/outer/inner", "/"});
    done({"mv", "/outer", "/inner"});

    mirrored();

    EXPECT_THAT(paths(), ElementsAre("inner", "inner/a.txt", "inner/outer"));
}

TEST_F(Mirror, RemovesWhatIsRemoved)
{
    put_content("/photos/deep/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    done({"rm", "-r", "/photos"});

    EXPECT_THAT(steps(),
                ElementsAre("removed photos/deep", "removed photos", "removed photos/deep/a.txt"));

    EXPECT_THAT(paths(), ElementsAre("b.txt"));
}

TEST_F(Mirror, TakesInWhatComesIntoTheFolderAndLetsOutWhatLeavesIt)
{
    put_content("/in/a.txt", "a");
    put_content("/out/deep/b.txt", "b");
    mirrored("/in");
    done({"mv", "/out/deep", "/in"});
    done({"mv", "/in/a.txt", "/out"});

    mirrored("/in");

    EXPECT_THAT(paths(), ElementsAre("deep", "deep/b.txt"));
}

TEST_F(Mirror, KeepsALocalChangeBesideWhatIsFetched)
{
    put_content("/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    put_content("/a.txt", "a2");
    write_here("a.txt", "mine");
    write_here("b.txt", "mine, too");
    write_here("b.txt.local-1", "there already");

    const outcome ended = mirrored();

    EXPECT_THAT(ended.out, HasSubstr("kept 2"));
    EXPECT_THAT(ended.err, HasSubstr("a.txt is not the account's; it is kept as "));
    EXPECT_EQ(content_of(path("a.txt")), "a2");
    EXPECT_EQ(content_of(path("a.txt.local-1")), "mine");
    EXPECT_EQ(content_of(path("b.txt")), "b");
    EXPECT_EQ(content_of(path("b.txt.local-1")), "there already");
    EXPECT_EQ(content_of(path("b.txt.local-2")), "mine, too");
}

TEST_F(Mirror, KeepsALocalChangeOfWhatIsRemovedOrMoved)
{
    put_content("/photos/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    write_here("photos/a.txt", "mine");
    write_here("b.txt", "mine, too");
    write_here("photos/extra", "extra");
    done({"rm", "-r", "/photos"});
    done({"mv", "/b.txt", "/c.txt"});

    const outcome ended = mirrored();

    EXPECT_THAT(ended.err, HasSubstr("photos/a.txt is no longer the account's; it stays"));
    EXPECT_THAT(paths(), ElementsAre("b.txt", "c.txt", "photos", "photos/a.txt", "photos/extra"));
    EXPECT_EQ(content_of(path("photos/a.txt")), "mine");
    EXPECT_EQ(content_of(path("b.txt")), "mine, too");
    EXPECT_EQ(content_of(path("c.txt")), "b");
}

TEST_F(Mirror, KeepsALocalChangeAlsoAfterARunThatCouldDoNothing)
{
    put_content("/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    write_here("a.txt", "mine");
    write_here("b.txt", "mine, too");
    // When it has kept its first state, and does not know yet what became of the account.
    run_killed("QUILLMERE_TEST_KILL_AT", "11");
    done({"rm", "/a.txt"});
    put_content("/b.txt", "b2");

    mirrored();

    EXPECT_EQ(content_of(path("a.txt")), "mine");
    EXPECT_EQ(content_of(path("b.txt.local-1")), "mine, too");
    EXPECT_EQ(content_of(path("b.txt")), "b2");
}

// What it was about to do has to be kept ahead of that, or else the bytes would be nobody's: by the
// next run the account has others.
TEST_F(Mirror, KnowsItsOwnFirstChangeAfterBeingKilledRightBehindIt)
{
    put_content("/a.txt", "a");
    mirrored();
    put_content("/a.txt", "a2");
    run_killed("QUILLMERE_TEST_KILL_WHEN_NAMED", "a.txt");
    ASSERT_EQ(content_of(path("a.txt")), "a2");
    put_content("/a.txt", "a3");

    EXPECT_THAT(steps(), ElementsAre("fetched a.txt"));

    EXPECT_THAT(paths(), ElementsAre("a.txt"));
    EXPECT_EQ(content_of(path("a.txt")), "a3");
}

TEST_F(Mirror, LeavesLocalFilesAloneAndTakesTheirPlaceForItsOwn)
{
    put_content("/same.txt", "same");
    put_content("/other.txt", "other");
    put_content("/folder/a.txt", "a");
    fs::create_directory(path());
    write_here("same.txt", "same");
    write_here("other.txt", "mine");
    write_here("folder", "no folder");
    write_here("extra", "extra");

    mirrored();

    EXPECT_EQ(result_of({"stat", "/same.txt"}).at("downloads"), 0);
    EXPECT_THAT(paths(), ElementsAre("extra", "folder", "folder.local-1", "folder/a.txt",
                                     "other.txt", "other.txt.local-1", "same.txt"));
    EXPECT_EQ(content_of(path("other.txt")), "other");
    EXPECT_EQ(content_of(path("other.txt.local-1")), "mine");
}

TEST_F(Mirror, BringsBackWhatIsMissingHere)
{
    put_content("/photos/a.txt", "a");
    mirrored();
    fs::remove_all(path("photos"));

    mirrored();

    EXPECT_EQ(content_of(path("photos/a.txt")), "a");
}

TEST_F(Mirror, KnowsATouchedFileByItsBytes)
{
    put_content("/a.txt", "a");
    mirrored();
    write_here("a.txt", "a");
    fs::last_write_time(path("a.txt"), fs::file_time_type());

    EXPECT_EQ(mirrored().out, path() + " is up to date\n");
}

TEST_F(Mirror, WritesNothingThroughALink)
{
    put_content("/photos/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    const std::string outside = download_path();
    home.folder().write("downloads/a.txt", "outside");
    fs::remove_all(path("photos"));
    fs::create_directory_symlink(outside, path("photos"));
    fs::remove(path("b.txt"));
    fs::create_symlink(outside + "/a.txt", path("b.txt"));
    put_content("/photos/a.txt", "new");
    put_content("/photos/c.txt", "c");
    put_content("/b.txt", "b2");

    mirrored();

    EXPECT_THAT(downloaded(), ElementsAre("a.txt"));
    EXPECT_EQ(content_of(outside + "/a.txt"), "outside");
    EXPECT_EQ(content_of(path("photos/a.txt")), "new");
    EXPECT_TRUE(fs::is_symlink(path("photos.local-1")));
    EXPECT_TRUE(fs::is_symlink(path("b.txt.local-1")));
}

TEST_F(Mirror, RemovesNothingThroughALink)
{
    put_content("/photos/a.txt", "a");
    mirrored();
    const std::string outside = home.folder().path_of("outside");
    fs::rename(path("photos"), outside);
    fs::create_directory_symlink(outside, path("photos"));
    done({"rm", "-r", "/photos"});

    mirrored();

    EXPECT_EQ(content_of(outside + "/a.txt"), "a");
}

TEST_F(Mirror, ShowsOneOfTwoEntriesOfANameAndSaysSo)
{
    add_account("other@example.org");
    emulator_command(
        {"put-content", "--account", "other@example.org", "--path", "/name/a.txt", "--from", "-"},
        "a");
    const json other = dump_of("other@example.org");
    const std::string key = other.at("root").at("folders").at(0).at("key");
    put_content("/name", "file");
    put_content("/b.txt", "b");
    done({"attach", "key:" + key});

    const outcome ended = home.run({"mirror", "/", path(), "--quiet"});

    EXPECT_EQ(ended.exit_status, 8);
    EXPECT_THAT(ended.err, HasSubstr("is left out: its name is also that of key:" + key));
    EXPECT_THAT(ended.err, HasSubstr("1 entry is left out"));
    EXPECT_THAT(paths(), ElementsAre("b.txt", "name", "name/a.txt"));
}

TEST_F(Mirror, BeginsAgainWhenTheAccountDidAndFetchesOnlyWhatIsNew)
{
    put_content("/photos/a.txt", "a");
    put_content("/photos/b.txt", "b");
    put_content("/old.txt", "old");
    mirrored();
    emulator_command({"reset"});
    put_content("/photos/a.txt", "a");
    put_content("/photos/b.txt", "b2");
    for (int i = 0; i < 6; ++i) // past the revision that is known
        put_content("/more" + std::to_string(i), "more");

    mirrored();

    EXPECT_EQ(result_of({"stat", "/photos/a.txt"}).at("downloads"), 0);
    EXPECT_EQ(content_of(path("photos/b.txt")), "b2");
    EXPECT_EQ(content_of(path("more5")), "more");
    EXPECT_FALSE(fs::exists(path("old.txt")));
    EXPECT_EQ(mirrored().out, path() + " is up to date\n");
}

TEST_F(Mirror, BeginsAgainWhereTheFeedDoesNotReachBack)
{
    put_content("/photos/a.txt", "a");
    put_content("/b.txt", "b");
    mirrored();
    emulator_command({"reset"});
    put_content("/b.txt", "b");

    mirrored();

    EXPECT_THAT(paths(), ElementsAre("b.txt"));
    EXPECT_EQ(result_of({"stat", "/b.txt"}).at("downloads"), 0);
}

TEST_F(Mirror, LeavesTheCopyWhenTheFolderIsGone)
{
    const std::string key = result_of({"mkdir", "/photos"}).at("key");
    put_content("/photos/a.txt", "a");
    mirrored("/photos");
    done({"rm", "-r", "/photos"});

    error_of({"mirror", "/photos", path()}, 3);
    error_of({"mirror", "key:" + key, path()}, 3);

    EXPECT_EQ(content_of(path("a.txt")), "a");
}

TEST_F(Mirror, IsOfOneFolderAlone)
{
    put_content("/photos/a.txt", "a");
    mirrored("/photos");

    const json error = error_of({"mirror", "/", path()}, 2);

    EXPECT_THAT(error.at("message"), HasSubstr("is a mirror of another folder"));
    EXPECT_THAT(paths(), ElementsAre("a.txt"));
}

TEST_F(Mirror, RefusesAFileAsEitherSide)
{
    put_content("/a.txt", "a");
    home.folder().write("file", "");

    error_of({"mirror", "/a.txt", path()}, 3);
    error_of({"mirror", "/", home.folder().path_of("file")}, 9);
    error_of({"mirror", "/nowhere", path()}, 3);
}

TEST_F(Mirror, BringsListingsAndFeedsOfSeveralParts)
{
    for (int i = 0; i < 105; ++i)
        local("files/file" + std::to_string(i), "");
    for (int i = 0; i < 260; ++i)
        fs::create_directories(home.folder().path_of("folders/folder" + std::to_string(i)));
    const auto put = [this](const std::string &to, const std::string &from) {
        emulator_command({"put-content", "--account", account_email, "--path", to, "--from",
                          home.folder().path_of(from)});
    };
    put("/files", "sources/files");

    mirrored();

    EXPECT_EQ(paths().size(), 106u) << "more than a chunk of a listing";
    put("/folders", "folders");
    done({"cp", "-r", "/folders", "/copied"});
    done({"rm", "-r", "/folders"});
    done({"rm", "-r", "/copied"}); // more than 500 changes, a block of the feed
    put_content("/last.txt", "last");
    mirrored();
    EXPECT_EQ(content_of(path("last.txt")), "last");
}

TEST_F(Mirror, ForeseesANewCopyWithoutMakingIt)
{
    put_content("/photos/a.txt", "a");

    const outcome ended = done({"mirror", "/photos", path(), "--dry-run"});

    EXPECT_EQ(ended.out, "Would mirror /photos to " + path() + ": fetch 1 file (1 B)\n");
    EXPECT_FALSE(fs::exists(path()));
    EXPECT_EQ(result_of({"stat", "/photos/a.txt"}).at("downloads"), 0);
}

TEST_F(Mirror, ForeseesWhatMakesWayInAFolderThatIsNoMirrorYet)
{
    put_content("/same.txt", "same");
    put_content("/other.txt", "other");
    put_content("/folder/a.txt", "a");
    put_content("/taken/b.txt", "b");
    fs::create_directories(path("taken/b.txt"));
    write_here("same.txt", "same");
    write_here("other.txt", "mine");
    write_here("other.txt.local-1", "mine, too");
    write_here("folder", "no folder");

    const auto foreseen = foreseen_steps();

    EXPECT_THAT(foreseen,
                UnorderedElementsAre("made folder", "fetched folder/a.txt", "fetched other.txt",
                                     "fetched taken/b.txt", "kept folder.local-1 folder",
                                     "kept other.txt.local-2 other.txt",
                                     "kept taken/b.txt.local-1 taken/b.txt"));
    EXPECT_EQ(steps(), foreseen);
}

TEST_F(Mirror, ForeseesChangesOfEveryKind)
{
    for (const char *each : {"/one/a.txt", "/two/a.txt", "/gone/deep/b.txt", "/gone/mine.txt",
                             "/left/c.txt", "/outer/inner/d.txt", "/e.txt", "/f.txt", "/g.txt"})
        put_content(each, each);
    mirrored();
    done({"mv", "/one", "/three"});
    done({"mv", "/two", "/one"});
    done({"mv", "/three", "/two"});
    done({"rm", "-r", "/gone"});
    done({"rm", "-r", "/left"});
    done({"mv", "/outer/inner", "/"});
    done({"mv", "/outer", "/inner"});
    put_content("/e.txt", "e2");
    done({"mv", "/f.txt", "/inner/outer"});
    put_content("/inner/outer/f.txt", "f2");
    put_content("/left/extra.txt", "now the account's");
    put_content("/again.txt", "/left/c.txt"); // the bytes of what goes
    write_here("gone/mine.txt", "changed here");
    write_here("left/extra.txt", "extra");
    write_here("g.txt", "changed here, too");

    const auto foreseen = foreseen_steps();

    EXPECT_THAT(foreseen, IsSupersetOf({"moved two one", "moved one two", "removed gone/deep",
                                        "moved again.txt left/c.txt", "kept gone",
                                        "kept gone/mine.txt", "kept g.txt.local-1 g.txt",
                                        "kept left/extra.txt.local-1 left/extra.txt",
                                        "fetched e.txt", "fetched inner/outer/f.txt"}));
    EXPECT_EQ(steps(), foreseen);
}

TEST_F(Mirror, SaysOfADryRunThatNothingIsDoneYet)
{
    put_content("/a.txt", "a");
    mirrored();
    put_content("/b.txt", "bb");
    write_here("b.txt", "mine");

    const outcome ended = done({"mirror", "/", path(), "-n"});

    EXPECT_EQ(ended.out, "Would mirror / to " + path() + ": fetch 1 file (2 B), keep 1\n");
    EXPECT_THAT(ended.err, HasSubstr("b.txt is not the account's; it would be kept as "));
    EXPECT_EQ(content_of(path("b.txt")), "mine");
}

TEST_F(Mirror, ForeseesNothingWhenNothingChanged)
{
    put_content("/a.txt", "a");
    mirrored();

    EXPECT_EQ(done({"mirror", "/", path(), "--dry-run"}).out, path() + " is up to date\n");
}

TEST_F(Mirror, FollowsNothingInADryRun)
{
    error_of({"mirror", "/", path(), "--dry-run", "--follow"}, 2);
}

TEST_F(HostileService, LeadsTheMirrorNowhereElse)
{
    for (const char *evil : {"../evil", "..", "/evil", "deep/evil", ".quillmere-mirror"}) {
        name = evil;

        const outcome ended = home.run({"mirror", "key:f", into, "--quiet"});

        EXPECT_EQ(ended.exit_status, 8) << evil << ended.err;
        EXPECT_THAT(ended.err, HasSubstr("is left out")) << evil;
        EXPECT_FALSE(fs::exists(home.folder().path_of("evil"))) << evil;
        EXPECT_THAT(names_in(into), ElementsAre(".quillmere-mirror")) << evil;
        fs::remove_all(into);
    }
}

TEST_F(HostileService, GetsNoOtherBytesIntoTheCopy)
{
    bytes_reply = [this](const request &) { return http_reply(200, some_bytes(bytes.size(), 2)); };

    const outcome ended = home.run({"mirror", "key:f", into, "--quiet"});

    EXPECT_EQ(ended.exit_status, 7) << ended.err;
    EXPECT_THAT(ended.err, HasSubstr("the bytes that arrived are not those of key:f/name"));
    EXPECT_THAT(names_in(into), ElementsAre(".quillmere-mirror"));
}

TEST_F(Mirror, FollowsUntilItIsInterrupted)
{
    put_content("/a.txt", "a");
    process following(home.with({"mirror", "/", path(), "--follow", "--interval", "1"}));
    EXPECT_THAT(following.wait_for_line(channel::out), HasSubstr("fetched 1 file (1 B)"));
    EXPECT_THAT(error_of({"mirror", "/", path()}, 9).at("message"),
                HasSubstr("another process is mirroring"));
    error_of({"mirror", "/", path(), "--dry-run"}, 9);

    put_content("/b.txt", "bb");

    EXPECT_THAT(following.wait_for_line(channel::out, "fetched 1 file (2 B)"),
                HasSubstr("fetched"));
    EXPECT_EQ(content_of(path("b.txt")), "bb");
    following.send_signal(SIGINT);
    EXPECT_EQ(following.wait().exit_status, 130);
    EXPECT_EQ(mirrored().out, path() + " is up to date\n");
}

TEST_F(Mirror, FollowsThroughAnEmulatorThatIsAway)
{
    put_content("/a.txt", "a");
    const std::uint16_t port =
        static_cast<std::uint16_t>(std::stoi(base.substr(base.rfind(':') + 1)));
    process following(
        home.with({"mirror", "/", path(), "--follow", "--interval", "1", "--retries", "0"}));
    following.wait_for_line(channel::out, "fetched 1 file");

    emulator->terminate();
    following.wait_for_line(channel::err, "no answer");
    put_content("/b.txt", "bb");
    command again;
    again.program = QUILLMERE_EMULATOR;
    again.arguments = {"--data",      data, "--port",     std::to_string(port),
                       "--http-port", "0",  "--ready-fd", "3"};
    process restarted(again);
    restarted.wait_for_line(channel::report, "https_url");

    following.wait_for_line(channel::out, "(2 B)");
    EXPECT_EQ(content_of(path("b.txt")), "bb");
    following.send_signal(SIGTERM);
    EXPECT_EQ(following.wait().signal, SIGTERM);
}

} // namespace quillmere_test
