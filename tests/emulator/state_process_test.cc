// The real program with a tree in its store: commands beside a server, downloads over the wire, and
// what a kill leaves.
#include <csignal>
#include <filesystem>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "files.h"
#include "process.h"
#include "scratch_directory.h"
#include "socket_client.h"
#include "store/database.h"
#include "tree_fixture.h"

namespace fs = std::filesystem;

namespace {

class StateProcess : public testing::Test {
protected:
    StateProcess()
    {
        add_ann(data, {"--profile", "first_name=Ann", "--bandwidth-limit", "4000000"});
        fs::create_directories(source / "photos");
        emulator::write_file(source / "photos/a.jpg", picture, 0600);
    }

    finished_process put(const std::string &path, const std::string &from,
                         const std::string &input = {})
    {
        return run_program({"put-content", "--data", data, "--account", "ann@example.org", "--path",
                            path, "--from", from},
                           input);
    }

    std::string dump()
    {
        const finished_process done = run_program({"--data", data, "--dump"});
        EXPECT_EQ(done.exit_code, 0) << done.errors;
        return done.output;
    }

    /** The path of the direct link of the only file. */
    static std::string link_path(std::uint16_t port)
    {
        const std::string token = log_in(port);
        const std::string feed =
            get(port, "/api/device/get_changes.php?revision=0&device_id=0&session_token=" + token);
        const std::string links = get(port, "/api/file/get_links.php?session_token=" + token +
                                                "&quick_key=" + element(feed, "quickkey"));
        const std::string link = element(links, "direct_download");
        EXPECT_EQ(link.rfind("http://localhost/", 0), 0u) << "as the client named the host";
        return path_of(link);
    }

    std::size_t whole_contents() const
    {
        std::size_t count = 0;
        for (const auto &each : fs::recursive_directory_iterator(fs::path(data) / "content"))
            if (each.is_regular_file() && each.path().filename().string().size() == 64)
                ++count;
        return count;
    }

    static std::string some_bytes(std::size_t count)
    {
        std::string bytes(count, '\0');
        for (std::size_t at = 0; at < count; ++at)
            bytes[at] = static_cast<char>((at * 7 + at / 251) & 0xFF);
        return bytes;
    }

    scratch_directory scratch;
    const std::string data = scratch.path() / "data";
    const fs::path source = scratch.path() / "source";
    const std::string picture = some_bytes(300'000);
};

std::string body_in(const std::string &reply) { return reply.substr(reply.find("\r\n\r\n") + 4); }

std::string get_range(std::uint16_t port, const std::string &target, const std::string &range)
{
    socket_client client(port);
    client.send("GET " + target + " HTTP/1.1\r\nHost: localhost\r\nRange: " + range +
                "\r\nConnection: close\r\n\r\n");
    return client.read_to_end();
}

} // namespace

TEST_F(StateProcess, ServesWhatWasPreloaded)
{
    const server_process server(data,
                                {"--preload", source.string(), "--account", "ann@example.org"});

    const std::string reply = get(server.http_port(), link_path(server.http_port()));

    EXPECT_EQ(reply.rfind("HTTP/1.1 200 OK\r\n", 0), 0u);
    EXPECT_TRUE(body_in(reply) == picture);
}

TEST_F(StateProcess, ServesPartsOverOneConnection)
{
    const server_process server(data,
                                {"--preload", source.string(), "--account", "ann@example.org"});
    const std::string path = link_path(server.http_port());
    const std::string part = get_range(server.http_port(), path, "bytes=100000-199999");
    socket_client client(server.http_port());

    client.send("HEAD " + path + " HTTP/1.1\r\nHost: localhost\r\n\r\n");
    const std::string head = client.read_until("\r\n\r\n");
    client.send("GET " + path + " HTTP/1.1\r\nHost: localhost\r\n\r\n");
    const std::string whole = client.read_reply();
    client.send("GET /api/system/get_status.php HTTP/1.1\r\nHost: localhost\r\n\r\n");

    EXPECT_EQ(part.rfind("HTTP/1.1 206 Partial Content\r\n", 0), 0u);
    EXPECT_NE(part.find("Content-Range: bytes 100000-199999/300000\r\n"), std::string::npos);
    EXPECT_TRUE(body_in(part) == picture.substr(100'000, 100'000));
    EXPECT_NE(head.find("Content-Length: 300000\r\n"), std::string::npos);
    EXPECT_TRUE(body_in(whole) == picture);
    EXPECT_EQ(element(client.read_reply(), "database"), "live");
}

TEST_F(StateProcess, ServesBytesOverHttpsWithLinksToItself)
{
    const server_process server(data,
                                {"--preload", source.string(), "--account", "ann@example.org"});
    const std::string path = link_path(server.http_port());

    const std::string reply = get_verified(server.https_port(), path, server.root(), "localhost");

    EXPECT_TRUE(body_in(reply) == picture);
}

TEST_F(StateProcess, DoesNotRepeatAHostThatIsNone)
{
    const server_process server(data,
                                {"--preload", source.string(), "--account", "ann@example.org"});
    const std::string token = log_in(server.http_port());
    const std::string key = element(get(server.http_port(), "/api/device/get_changes.php?revision=0"
                                                            "&device_id=0&session_token=" +
                                                                token),
                                    "quickkey");
    socket_client client(server.http_port());

    client.send("GET /api/file/get_links.php?quick_key=" + key +
                " HTTP/1.1\r\nHost: a/b@c\r\nConnection: close\r\n\r\n");

    const std::string link = element(client.read_to_end(), "direct_download");
    EXPECT_EQ(link.rfind("http://localhost:" + std::to_string(server.http_port()) + "/", 0), 0u);
}

TEST_F(StateProcess, BreaksAReplyWhoseFileIsTooShortRatherThanPadIt)
{
    const server_process server(data,
                                {"--preload", source.string(), "--account", "ann@example.org"});
    const std::string path = link_path(server.http_port());
    for (const auto &each : fs::recursive_directory_iterator(fs::path(data) / "content"))
        if (each.is_regular_file())
            fs::resize_file(each.path(), 1000);

    const std::string reply = get(server.http_port(), path);

    EXPECT_NE(reply.find("Content-Length: 300000\r\n"), std::string::npos);
    EXPECT_LE(body_in(reply).size(), 1000u);
    EXPECT_EQ(element(get(server.http_port(), "/api/system/get_status.php"), "database"), "live");
}

TEST_F(StateProcess, CommandsTakeEffectBesideAServer)
{
    const server_process server(data);

    EXPECT_EQ(put("/photos/b.jpg", source / "photos/a.jpg").exit_code, 0);
    EXPECT_EQ(put("/notes.txt", "-", "from standard input").exit_code, 0);
    const std::string token = log_in(server.http_port());
    const std::string changes = "/api/device/get_changes.php?revision=0&device_id=0&session_token=";
    const std::string before = get(server.http_port(), changes + token);
    EXPECT_EQ(run_program({"reset", "--data", data}).exit_code, 0);
    const std::string after = get(server.http_port(), changes + token);

    EXPECT_EQ(elements(before, "filename"), (std::vector<std::string>{"b.jpg", "notes.txt"}));
    EXPECT_EQ(element(after, "device_revision"), "1") << "and the session lives on";
    EXPECT_EQ(whole_contents(), 0u);
}

TEST_F(StateProcess, DumpIsJsonOfTheState)
{
    put("/notes.txt", "-", "text");

    const std::string shown = dump();

    EXPECT_EQ(shown.rfind("{\n  \"accounts\": [", 0), 0u);
    for (const char *part : {"\"email\": \"ann@example.org\"", "\"first_name\": \"Ann\"",
                             "\"name\": \"notes.txt\"", "\"bandwidth_limit\": 4000000"})
        EXPECT_NE(shown.find(part), std::string::npos) << part;
    EXPECT_EQ(shown.find("secret"), std::string::npos);
}

TEST_F(StateProcess, RefusesWhatItCannotLoad)
{
    EXPECT_EQ(put("/x", "/nonexistent").exit_code, 1);
    EXPECT_EQ(put("/x", "/dev/null").exit_code, 1);
    EXPECT_EQ(run_program({"put-content", "--data", data, "--account", "bob@example.org", "--path",
                           "/", "--from", source})
                  .exit_code,
              1);
    EXPECT_EQ(run_program({"--data", data, "--preload", source}).exit_code, 2);
    EXPECT_EQ(run_program({"add-account", "--data", data, "--email", "x", "--password-file", "-",
                           "--profile", "shoe_size=43"},
                          "secret")
                  .exit_code,
              1);
}

TEST_F(StateProcess, AKillWhileContentComesInLeavesNoTrace)
{
    const std::string before = dump();
    {
        fed_process loading({"put-content", "--data", data, "--account", "ann@example.org",
                             "--path", "/big", "--from", "-"});
        loading.feed(some_bytes(3'000'000)); // most of it is read and written by now
        loading.kill();
    }

    EXPECT_EQ(dump(), before);
    EXPECT_EQ(whole_contents(), 0u);
    EXPECT_EQ(put("/big", "-", "whole").exit_code, 0);
    EXPECT_EQ(run_program({"reset", "--data", data}).exit_code, 0);
    for (const auto &each : fs::recursive_directory_iterator(fs::path(data) / "content"))
        EXPECT_TRUE(each.is_directory()) << each.path();
}

TEST_F(StateProcess, KeepsEveryAcknowledgedChangeOverAKill)
{
    std::set<std::string> acknowledged;
    for (int round = 0; round < 3; ++round) {
        server_process server(data);
        const std::string token = log_in(server.http_port());
        const pid_t victim = server.id();
        std::thread killer;
        socket_client client(server.http_port());
        for (int number = 0;; ++number) {
            const std::string name = "f" + std::to_string(round) + "x" + std::to_string(number);
            std::string reply;
            try {
                client.send("GET /api/folder/create.php?foldername=" + name +
                            "&session_token=" + token + " HTTP/1.1\r\nHost: localhost\r\n\r\n");
                reply = client.read_reply();
            } catch (const std::runtime_error &) {
                break; // the server is gone
            }
            if (element(reply, "result") != "Success")
                break;
            acknowledged.insert(name);
            if (number == 20 * round) // the next change and the kill run into each other
                killer = std::thread([victim] { ::kill(victim, SIGKILL); });
        }
        killer.join();
    }

    const server_process server(data);
    const std::string token = log_in(server.http_port());
    std::set<std::string> kept;
    for (int chunk = 1; chunk <= 5; ++chunk)
        for (const std::string &name :
             elements(get(server.http_port(), "/api/1.0/folder/get_content.php?content_type=folders"
                                              "&session_token=" +
                                                  token + "&chunk=" + std::to_string(chunk)),
                      "name"))
            kept.insert(name);
    for (const std::string &name : acknowledged)
        EXPECT_EQ(kept.count(name), 1u) << name;
    EXPECT_LE(kept.size(), acknowledged.size() + 3) << "at most one unanswered change a round";
    emulator::database store(fs::path(data) / "store.sqlite");
    emulator::statement check =
        store.prepare("SELECT (SELECT count(*) FROM folders WHERE parent IS NOT NULL),"
                      " (SELECT count(*) FROM feed), (SELECT max(revision) FROM feed),"
                      " (SELECT revision FROM accounts)");
    ASSERT_TRUE(check.step());
    EXPECT_EQ(check.number(0), check.number(1)) << "a change and its record belong together";
    EXPECT_EQ(check.number(2), check.number(3));
}
