// Downloads from a service that does everything that can go wrong with a link.
#include <filesystem>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "fake_download.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

class DownloadLink : public fake_download {
protected:
    outcome get(const std::string &what = "key:k", std::vector<std::string> more = {})
    {
        more.insert(more.begin(), {"get", what, into, "--retries", "0"});
        return home.run(more);
    }

    /** The beginning of the file, as an earlier download would have left it. */
    void begin(std::size_t count) const
    {
        home.folder().write("into/.quillmere-" + sha256_of(bytes) + ".part",
                            bytes.substr(0, count));
    }
};

} // namespace

TEST_F(DownloadLink, BringsTheBytes)
{
    EXPECT_EQ(get().exit_status, 0);

    EXPECT_EQ(content_of(into + "/name"), bytes);
}

TEST_F(DownloadLink, IsAskedForWhatIsMissing)
{
    begin(4'000);
    std::string range;
    bytes_reply = [&](const request &asked) {
        range = asked.header("Range").value_or("");
        return http_reply(206, bytes.substr(4'000), {"Content-Range: bytes 4000-9999/10000"});
    };

    const outcome ended = get();

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(range, "bytes=4000-");
    EXPECT_EQ(content_of(into + "/name"), bytes);
}

TEST_F(DownloadLink, MayLeadToTheWholeAllTheSame)
{
    begin(4'000);

    EXPECT_EQ(get().exit_status, 0);
    EXPECT_EQ(content_of(into + "/name"), bytes);
}

TEST_F(DownloadLink, IsAskedForTheWholeWhenItBringsAnotherPart)
{
    for (const char *range : {"bytes 4001-9999/10000", "nonsense"}) {
        begin(4'000);
        bytes_reply = [&](const request &asked) {
            return asked.header("Range") ? http_reply(206, bytes.substr(4'001),
                                                      {"Content-Range: " + std::string(range)})
                                         : http_reply(200, bytes);
        };

        const outcome ended = get();

        EXPECT_EQ(ended.exit_status, 0) << ended.err;
        EXPECT_EQ(content_of(into + "/name"), bytes);
        fs::remove(into + "/name");
    }
}

TEST_F(DownloadLink, IsAskedForTheWholeWhenItHasNoSuchPart)
{
    begin(4'000);
    bytes_reply = [&](const request &asked) {
        return asked.header("Range") ? http_reply(416, "") : http_reply(200, bytes);
    };

    EXPECT_EQ(get().exit_status, 0);
    EXPECT_EQ(content_of(into + "/name"), bytes);
}

TEST_F(DownloadLink, WithOtherBytesIsNoSuccess)
{
    for (const std::string &wrong : {some_bytes(10'000, 2), bytes.substr(1), bytes + "!"}) {
        bytes_reply = [&](const request &) { return http_reply(200, wrong); };

        const outcome ended = get();

        EXPECT_EQ(ended.exit_status, 7) << ended.err;
        EXPECT_FALSE(fs::exists(into + "/name"));
    }
}

TEST_F(DownloadLink, ThatIsRefusedSaysWhy)
{
    bytes_reply = [](const request &) {
        return http_reply(403, "<response><result>Error</result><error>123</error>"
                               "<message>Enough for today</message></response>");
    };
    const outcome refused = get();
    bytes_reply = [](const request &) { return http_reply(503, "<html>later</html>"); };
    const outcome page = get();

    EXPECT_EQ(refused.exit_status, 3);
    EXPECT_THAT(refused.err, HasSubstr("123: Enough for today"));
    EXPECT_EQ(page.exit_status, 6);
    EXPECT_THAT(page.err, HasSubstr("HTTP 503"));
    EXPECT_TRUE(fs::is_empty(into));
}

TEST_F(DownloadLink, MayLeadElsewhereEncryptedAlone)
{
    scripted_server plain;
    plain.answer(http_reply(200, bytes));
    bytes_reply = [&](const request &) {
        return http_reply(302, "", {"Location: " + plain.base_url() + "/bytes"});
    };

    EXPECT_EQ(get().exit_status, 5);
    EXPECT_EQ(plain.connections(), 0u);
}

TEST_F(DownloadLink, IsUnencryptedOnRequestAlone)
{
    scripted_server plain;
    plain.answer(http_reply(200, bytes));
    link = plain.base_url() + "/bytes";

    EXPECT_EQ(get().exit_status, 5);
    EXPECT_EQ(plain.connections(), 0u);
}

TEST_F(DownloadLink, NeverLeadsOutOfTheFolder)
{
    for (const char *evil : {"..", "../escaped", "/tmp/escaped", ".", "a/b"}) {
        name = evil;

        const outcome alone = get();
        const outcome inside = get("key:f", {"-r"});

        EXPECT_EQ(alone.exit_status, 9) << evil << alone.err;
        EXPECT_EQ(inside.exit_status, 9) << evil << inside.err;
    }
    EXPECT_FALSE(fs::exists(home.folder().path_of("escaped")));
    for (const auto &each : fs::recursive_directory_iterator(into))
        EXPECT_TRUE(each.is_directory()) << each.path();
}

} // namespace quillmere_test
