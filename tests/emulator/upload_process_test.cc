// Uploads to the real program, byte by byte as they go over the wire.
#include <filesystem>
#include <string>

#include <sys/inotify.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "digest.h"
#include "process.h"
#include "scratch_directory.h"
#include "socket_client.h"
#include "tree_fixture.h"

namespace fs = std::filesystem;

namespace {

std::string hash_in_hex(const std::string &bytes)
{
    emulator::sha256_sum sum;
    sum.add(bytes);
    return sum.finish_hex();
}

class UploadProcess : public testing::Test {
protected:
    UploadProcess()
    {
        add_ann(data);
        server.emplace(data);
        token = log_in(server->http_port());
    }

    std::string post(const std::string &fields, const std::string &parameters = {}) const
    {
        return "POST /api/upload/upload.php?type=desktop&session_token=" + token + parameters +
               " HTTP/1.1\r\nHost: localhost\r\n" + fields + "\r\n";
    }

    std::string post_abc(const std::string &name, const std::string &more = {}) const
    {
        return post("Content-Disposition: attachment; filename=\"" + name + "\"\r\n" +
                    "Content-Digest: " + abc_digest + "\r\nContent-Length: 3\r\n" + more);
    }

    std::string listing() const
    {
        return get(server->http_port(),
                   "/api/1.0/folder/get_content.php?content_type=files&session_token=" + token);
    }

    fs::path content() const { return fs::path(data) / "content"; }

    std::size_t stored_files() const
    {
        std::size_t count = 0;
        for (const auto &each : fs::recursive_directory_iterator(content()))
            count += each.is_regular_file();
        return count;
    }

    scratch_directory scratch;
    const std::string data = scratch.path() / "data";
    std::optional<server_process> server;
    std::string token;
};

/** Tells when a file of a folder has been removed. */
class removals {
public:
    explicit removals(const fs::path &folder)
    {
        ::inotify_add_watch(watch_.number(), folder.c_str(), IN_DELETE);
    }
    void wait_for_one()
    {
        char event[sizeof(inotify_event) + 256];
        ASSERT_GT(::read(watch_.number(), event, sizeof event), 0);
    }

private:
    emulator::descriptor watch_{::inotify_init1(IN_CLOEXEC)};
};

} // namespace

TEST_F(UploadProcess, GoesOverHttpAndKeepsTheConnection)
{
    socket_client client(server->http_port());

    client.send(post_abc("a.txt") + "abc" + post_abc("b.txt") + "abc");

    EXPECT_EQ(element(client.read_reply(), "result"), "0");
    EXPECT_EQ(element(client.read_reply(), "result"), "0");
    EXPECT_EQ(elements(listing(), "filename"), (std::vector<std::string>{"a.txt", "b.txt"}));
    EXPECT_EQ(stored_files(), 1u);
}

TEST_F(UploadProcess, GoesOverHttps)
{
    const std::string reply =
        ask_verified(server->https_port(), post_abc("a.txt", "Connection: close\r\n") + "abc",
                     server->root(), "localhost");

    EXPECT_EQ(element(reply, "result"), "0") << reply;
    EXPECT_EQ(elements(listing(), "hash"), std::vector<std::string>{hash_in_hex("abc")});
}

TEST_F(UploadProcess, ComesInChunksByteByByte)
{
    socket_client client(server->http_port());
    const std::string request =
        post("Content-Disposition: attachment; filename=a.txt\r\nRepr-Digest: " + abc_digest +
             "\r\nTransfer-Encoding: chunked\r\n") +
        "1\r\na\r\n2\r\nbc\r\n0\r\n\r\n";

    for (const char byte : request)
        client.send(std::string(1, byte));

    EXPECT_EQ(element(client.read_reply(), "result"), "0");
    EXPECT_EQ(elements(listing(), "hash"), std::vector<std::string>{hash_in_hex("abc")});
}

TEST_F(UploadProcess, LargerThanAnyOtherBodyMayBeARevision)
{
    socket_client client(server->http_port());
    client.send(post_abc("a.txt") + "abc");
    const std::string key = element(client.read_reply(), "key");
    const std::string revision =
        element(get(server->http_port(),
                    "/api/file/get_info.php?session_token=" + token + "&quick_key=" + key),
                "revision");
    const std::string bytes(3'000'000, 'x');

    client.send(post("Content-Length: 3000000\r\n", "&quickkey=" + key + "&revision=" + revision +
                                                        "&target_hash=" + hash_in_hex(bytes) +
                                                        "&target_size=3000000") +
                bytes);

    EXPECT_EQ(element(client.read_reply(), "key"), key);
    EXPECT_EQ(elements(listing(), "hash"), std::vector<std::string>{hash_in_hex(bytes)});
}

TEST_F(UploadProcess, ThatIsRefusedIsNotInvited)
{
    socket_client client(server->http_port());
    client.send(post_abc("..", "Expect: 100-continue\r\n"));

    const std::string reply = client.read_to_end();

    EXPECT_EQ(reply.substr(0, 12), "HTTP/1.1 400") << reply;
    EXPECT_EQ(element(reply, "error"), "106");
}

TEST_F(UploadProcess, ThatIsCutLeavesNothing)
{
    for (const char *beginning : {"", "a", "ab"}) {
        removals removed(content());
        {
            socket_client client(server->http_port());
            client.send(post_abc("a.txt", "Expect: 100-continue\r\n"));
            client.read_until("\r\n\r\n");
            EXPECT_EQ(stored_files(), 1u) << "it is on its way";
            client.send(beginning);
        }

        removed.wait_for_one();

        EXPECT_EQ(stored_files(), 0u) << beginning;
        EXPECT_EQ(elements(listing(), "filename").size(), 0u) << beginning;
    }
}

TEST_F(UploadProcess, ThatIsUnderWayWhenTheServerEndsLeavesNothing)
{
    socket_client client(server->http_port());
    client.send(post_abc("a.txt", "Expect: 100-continue\r\n"));
    client.read_until("\r\n\r\n");

    EXPECT_EQ(server->stop(SIGTERM), 0);

    EXPECT_EQ(stored_files(), 0u);
}
