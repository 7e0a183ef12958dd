// Links, and the bytes behind them.
#include "socket_client.h"
#include "store/accounts.h"
#include "store/usage.h"
#include "tree_fixture.h"

using namespace emulator;

namespace {

class Links : public Tree {
protected:
    Links()
    {
        file = make_file("a b.txt");
        fill(file, "0123456789");
    }

    std::string links(const std::string &key, const std::string &type = {},
                      const std::string &who = ann)
    {
        const reply made = ask(who, "file/get_links", {{"quick_key", key}, {"link_type", type}});
        EXPECT_EQ(made.http_status, 200u) << made.body;
        return made.body;
    }
    std::string path(const std::string &type, const std::string &key)
    {
        return path_of(element(links(key, type), type));
    }
    std::string path(const std::string &type) { return path(type, file); }

    void limit_bandwidth(std::int64_t bytes)
    {
        put_account_limits(store, *find_account(store, ann), {{}, {}, bytes});
    }

    std::string file;
};

} // namespace

TEST_F(Links, AreThoseOfTheFile)
{
    const std::string link = element(links(file), "link");

    EXPECT_EQ(element(link, "quickkey"), file);
    for (const char *name :
         {"view", "normal_download", "direct_download", "edit", "one_time_download"})
        EXPECT_EQ(element(link, name).rfind("http://localhost:80/", 0), 0u) << name;
    for (const char *name : {"listen", "watch", "error", "direct_download_error"})
        EXPECT_EQ(elements(link, name).size(), 0u) << name;
}

TEST_F(Links, AreOfTheTypeAskedFor)
{
    for (const char *type :
         {"view", "normal_download", "direct_download", "edit", "one_time_download"}) {
        const std::string link = element(links(file, type), "link");
        for (const char *other :
             {"view", "normal_download", "direct_download", "edit", "one_time_download"})
            EXPECT_EQ(elements(link, other).size(), type == std::string(other) ? 1u : 0u)
                << type << other;
    }
    EXPECT_EQ(error_of("file/get_links", {{"quick_key", file}, {"link_type", "all"}}), "106");
}

TEST_F(Links, ToListenAndToWatchAreForAudioAndVideo)
{
    const std::string song = links(make_file("a.MP3"));
    const std::string film = links(make_file("a.mp4"));

    EXPECT_EQ(elements(song, "listen").size(), 0u) << "there is nothing to hear yet";
    const std::string full_song = make_file("b.mp3");
    fill(full_song, "tune");
    EXPECT_EQ(elements(links(full_song), "listen").size(), 1u);
    EXPECT_EQ(elements(links(full_song), "watch").size(), 0u);
    const std::string full_film = make_file("b.mp4");
    fill(full_film, "film");
    EXPECT_EQ(elements(links(full_film), "watch").size(), 1u);
    EXPECT_EQ(elements(links(full_film), "listen").size(), 0u);
    EXPECT_EQ(element(links(full_film), "edit_error_message"),
              "A file of this type cannot be edited");
}

TEST_F(Links, OfAFileWithoutContentSayWhyItCannotBeFetched)
{
    const std::string link = links(make_file("empty"));

    for (const char *name : {"view", "normal_download", "direct_download", "edit"})
        EXPECT_EQ(elements(link, name).size(), 0u) << name;
    EXPECT_EQ(element(link, "direct_download_error"), "118");
    EXPECT_EQ(element(link, "direct_download_error_message"), "The file has no content");
    EXPECT_EQ(element(link, "one_time_download_error_message"), "The file has no content");
}

TEST_F(Links, SayWhenTheBandwidthIsSpent)
{
    limit_bandwidth(10);
    const std::string before = links(file, "direct_download");
    const std::string where = path("direct_download");
    fetch(where);

    const std::string after = links(file, "direct_download");

    EXPECT_EQ(element(before, "direct_download_free_bandwidth"), "10");
    EXPECT_EQ(element(after, "direct_download_free_bandwidth"), "0");
    EXPECT_EQ(element(after, "direct_download_error"), "119");
    EXPECT_EQ(element(fetch(where).body, "error"), "119");
    EXPECT_EQ(element(fetch(where).body, "message"), "The bandwidth of the account is spent");
}

TEST_F(Links, FreeBandwidthFitsIntoTheNumberOfAClient)
{
    EXPECT_EQ(element(links(file), "direct_download_free_bandwidth"), "2147483647");
}

TEST_F(Links, OfSeveralFilesComeOneAfterAnother)
{
    const std::string other = make_file("b");
    const std::string hidden = make_file("c");
    done(ann, "file/update", {{"quick_key", hidden}, {"privacy", "private"}});

    const std::string body = links(file + ",none," + other + "," + hidden, "view", bob);

    const std::vector<std::string> all = elements(body, "link");
    ASSERT_EQ(all.size(), 4u);
    EXPECT_EQ(element(all[0], "quickkey"), file);
    EXPECT_EQ(element(all[1], "error"), "113");
    EXPECT_EQ(element(all[1], "quickkey"), "none");
    EXPECT_EQ(element(all[2], "quickkey"), other);
    EXPECT_EQ(element(all[3], "error"), "114");
}

TEST_F(Links, OfAFileAloneThatThereIsNotAreRefused)
{
    EXPECT_EQ(error_of("file/get_links", {{"quick_key", "none"}}), "113");
    EXPECT_EQ(error_of("file/get_links", {}), "104");
    done(ann, "file/update", {{"quick_key", file}, {"privacy", "private"}});
    EXPECT_EQ(error_of(nobody, "file/get_links", {{"quick_key", file}}), "114");
}

TEST_F(Links, OfAtMost500FilesAreGivenAtOnce)
{
    std::string keys = "none";
    for (int count = 1; count < 500; ++count)
        keys += ",none";

    EXPECT_EQ(error_of("file/get_links", {{"quick_key", keys}, {"link_type", "view"}}), "113");
    EXPECT_EQ(error_of("file/get_links", {{"quick_key", keys + ",none"}}), "106");
}

TEST_F(Links, ToEditAndToFetchOnceAreForTheOwner)
{
    const std::string link = links(file, "", bob);

    EXPECT_EQ(elements(link, "direct_download").size(), 1u);
    EXPECT_EQ(element(link, "edit_error_message"), "Access denied");
    EXPECT_EQ(element(link, "one_time_download_error_message"), "Access denied");
    EXPECT_EQ(elements(links(file, "", nobody), "one_time_download").size(), 0u);
}

TEST_F(Links, ServeTheBytes)
{
    const reply made = fetch(path("direct_download"));

    EXPECT_EQ(made.http_status, 200u);
    EXPECT_EQ(bytes_of(made), "0123456789");
    EXPECT_EQ(field_of(made, "Content-Type"), "text/plain");
    EXPECT_EQ(field_of(made, "Accept-Ranges"), "bytes");
    EXPECT_EQ(field_of(made, "ETag"), '"' + file_says(file, "hash") + '"');
    EXPECT_EQ(field_of(made, "Content-Disposition"), "attachment; filename*=UTF-8''a%20b.txt");
    EXPECT_EQ(field_of(fetch(path("view")), "Content-Disposition"),
              "inline; filename*=UTF-8''a%20b.txt");
    for (const char *type : {"view", "normal_download", "edit"})
        EXPECT_EQ(bytes_of(fetch(path(type))), "0123456789") << type;
}

TEST_F(Links, ServeAnEmptyContent)
{
    const std::string empty = make_file("empty");
    fill(empty, "");

    const reply made = fetch(path("direct_download", empty));

    EXPECT_EQ(made.http_status, 200u);
    EXPECT_EQ(bytes_of(made), "");
}

TEST_F(Links, ServeAPart)
{
    const std::string where = path("direct_download");

    const reply middle = fetch(where, "bytes=2-4");
    EXPECT_EQ(middle.http_status, 206u);
    EXPECT_EQ(bytes_of(middle), "234");
    EXPECT_EQ(field_of(middle, "Content-Range"), "bytes 2-4/10");
    EXPECT_EQ(bytes_of(fetch(where, "bytes=8-")), "89");
    EXPECT_EQ(bytes_of(fetch(where, "bytes=-1")), "9");
    EXPECT_EQ(fetch(where, "bytes=0-1,3-4").http_status, 200u);

    const reply none = fetch(where, "bytes=10-");
    EXPECT_EQ(none.http_status, 416u);
    EXPECT_EQ(field_of(none, "Content-Range"), "bytes */10");
    EXPECT_EQ(element(none.body, "error"), "125");
}

TEST_F(Links, ServeAPartOnlyOfTheContentThatTheClientHas)
{
    const std::string where = path("direct_download");
    const std::string tag = field_of(fetch(where), "ETag");

    EXPECT_EQ(fetch(where, "bytes=2-4", tag).http_status, 206u);
    for (const std::string &other :
         {std::string("\"other\""), "W/" + tag, std::string("Sat, 01 Jan 2022 00:00:00 GMT")})
        EXPECT_EQ(bytes_of(fetch(where, "bytes=2-4", other)), "0123456789") << other;

    fill(file, "changed");
    EXPECT_EQ(bytes_of(fetch(where, "bytes=2-4", tag)), "changed");
}

TEST_F(Links, CountDownloadsByTheirFirstByte)
{
    const std::string where = path("direct_download");

    fetch(where);
    fetch(where, "bytes=0-4");
    fetch(where, "bytes=5-");
    fetch(where, {}, {}, "HEAD");
    fetch(where, "bytes=10-");

    EXPECT_EQ(file_says(file, "downloads"), "2");
    EXPECT_EQ(done(ann, "user/get_limits", {}, "bandwidth_used"), "20");
}

TEST_F(Links, ThatServeOnceDoSo)
{
    const std::string where = path("one_time_download");

    EXPECT_EQ(fetch(where, {}, {}, "HEAD").http_status, 200u) << "a look spends nothing";
    const reply first = fetch(where, "bytes=2-4");
    EXPECT_EQ(first.http_status, 200u);
    EXPECT_EQ(bytes_of(first), "0123456789") << "nobody could come back for the rest";
    EXPECT_EQ(element(fetch(where).body, "error"), "124");
    EXPECT_EQ(done(ann, "user/get_limits", {}, "one_time_downloads_today"), "1");
}

TEST_F(Links, ThatServeOnceExpireAfterADay)
{
    const std::string where = path("one_time_download");
    time += 24 * 60 * 60;

    EXPECT_EQ(element(fetch(where).body, "error"), "124");
}

TEST_F(Links, ThatServeOnceAreLimitedByTheDay)
{
    const std::string late = path("one_time_download");
    for (std::uint64_t count = 0; count < one_time_download_limit; ++count)
        EXPECT_EQ(fetch(path("one_time_download")).http_status, 200u);

    EXPECT_EQ(element(links(file, "one_time_download"), "one_time_download_error_message"),
              "The limit of the day is reached");
    EXPECT_EQ(element(fetch(late).body, "error"), "123");
    time += 24 * 60 * 60 - 1;
    EXPECT_EQ(fetch(path("one_time_download")).http_status, 200u) << "another day";
}

TEST_F(Links, ToStreamsCountTowardsTheDay)
{
    const std::string song = make_file("a.mp3");
    fill(song, "12345");
    fetch(path("listen", song));

    EXPECT_EQ(done(ann, "user/get_limits", {}, "streaming_bandwidth_today"), "5");
    time += 24 * 60 * 60;
    EXPECT_EQ(done(ann, "user/get_limits", {}, "streaming_bandwidth_today"), "0");
    EXPECT_EQ(done(ann, "user/get_limits", {}, "bandwidth_used"), "5");
}

TEST_F(Links, LeadNowhereOnceTheFileIsDeleted)
{
    const std::string direct = path("direct_download");
    const std::string once = path("one_time_download");
    done(ann, "file/delete", {{"quick_key", file}});

    EXPECT_EQ(fetch(direct).http_status, 404u);
    EXPECT_EQ(fetch(once).http_status, 404u);
}

TEST_F(Links, CannotBeMadeOfAQuickKey)
{
    for (const std::string &target : {"/download/" + file + "/a", std::string("/download/"),
                                      std::string("/once/x"), std::string("/download/../store")})
        EXPECT_EQ(element(fetch(target).body, "error"), "124") << target;
}

TEST_F(Links, ServeWhoeverKnowsTheKeyUnderAnyName)
{
    std::string where = path("direct_download");
    where.resize(where.rfind('/'));

    EXPECT_EQ(fetch(where).http_status, 200u);
    EXPECT_EQ(fetch(where + "/other?x=y").http_status, 200u);
    EXPECT_EQ(fetch(where + "x").http_status, 404u);
    EXPECT_EQ(fetch(where, {}, {}, "POST").http_status, 405u);
}
