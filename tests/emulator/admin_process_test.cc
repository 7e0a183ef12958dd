// The real program with its admin address: what a client meets when a test asks for a fault.
#include <cctype>
#include <chrono>
#include <csignal>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "process.h"
#include "scratch_directory.h"
#include "socket_client.h"

using nlohmann::json;

namespace {

const std::string status_path = "/api/system/get_status.php";

std::string body_of(const std::string &reply) { return reply.substr(reply.find("\r\n\r\n") + 4); }

std::string status_of(const std::string &reply) { return reply.substr(0, 12); }

class AdminProcess : public testing::Test {
protected:
    AdminProcess()
    {
        add_ann(data);
        server.emplace(data, std::vector<std::string>{"--admin", "127.0.0.1:0"});
        token = log_in(server->http_port());
    }

    std::string ask_admin(const std::string &method, const std::string &target,
                          const std::string &body = {}) const
    {
        return ask(server->admin_port(), method, target, body);
    }

    json told(const std::string &target) const
    {
        return json::parse(body_of(ask_admin("GET", target)));
    }

    void place(const json &fault) const
    {
        const std::string reply = ask_admin("POST", "/faults", fault.dump());
        EXPECT_EQ(status_of(reply), "HTTP/1.1 201") << reply;
    }

    /** How often the one fault has fired. */
    int fired() const { return told("/faults").at("faults").at(0).at("fired"); }

    std::string get_over_http(const std::string &target) const
    {
        return get(server->http_port(), target);
    }

    std::string get_over_https(const std::string &target) const
    {
        return get_verified(server->https_port(), target, server->root(), "localhost");
    }

    std::string create_folder(const std::string &name) const
    {
        return "/api/folder/create.php?foldername=" + name + "&session_token=" + token;
    }

    std::string listing(const std::string &type) const
    {
        return get_over_http("/api/1.0/folder/get_content.php?content_type=" + type +
                             "&session_token=" + token);
    }

    std::string upload(const std::string &name) const
    {
        socket_client client(server->http_port());
        client.send("POST /api/upload/upload.php?type=desktop&session_token=" + token +
                    " HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n"
                    "Content-Disposition: attachment; filename=\"" +
                    name + "\"\r\nContent-Digest: " + abc_digest +
                    "\r\nContent-Length: 3\r\n\r\nabc");
        return client.read_to_end();
    }

    std::string refusal_of_certificate() const
    {
        try {
            get_over_https(status_path);
        } catch (const std::runtime_error &why) {
            return why.what();
        }
        return "";
    }

    scratch_directory scratch;
    const std::string data = scratch.path() / "data";
    std::optional<server_process> server;
    std::string token;
};

} // namespace

TEST_F(AdminProcess, IsAnnouncedWhereItIsAskedForAlone)
{
    const server_process without(scratch.path() / "other");

    EXPECT_EQ(without.ready_line().find("admin"), std::string::npos);
    const json line = json::parse(server->ready_line());
    EXPECT_EQ(line.at("admin_url"), "http://127.0.0.1:" + std::to_string(server->admin_port()));
    EXPECT_EQ(told("/health").at("status"), "ok");
}

TEST_F(AdminProcess, IsForThisMachineAlone)
{
    for (const char *address : {"0.0.0.0:0", "192.0.2.1:0", "[::]:0", "127.0.0.1", "localhost:0"}) {
        const finished_process refused =
            run_program({"--data", scratch.path() / "other", "--admin", address});
        EXPECT_EQ(refused.exit_code, 2) << address;
        EXPECT_NE(refused.errors.find("is no loopback address such as 127.0.0.1:0"),
                  std::string::npos)
            << refused.errors;
    }
}

TEST_F(AdminProcess, SaysThatItsPortIsTaken)
{
    const finished_process second =
        run_program({"--data", scratch.path() / "other", "--admin",
                     "127.0.0.1:" + std::to_string(server->admin_port())});

    EXPECT_EQ(second.exit_code, 1);
    EXPECT_NE(second.errors.find("cannot listen on port"), std::string::npos) << second.errors;
}

TEST_F(AdminProcess, AnswersWithAnotherStatusAndDoesNothing)
{
    place({{"kind", "status"}, {"status", 503}, {"count", 1}});

    const std::string reply = get_over_https(create_folder("a"));

    EXPECT_EQ(status_of(reply), "HTTP/1.1 503");
    EXPECT_NE(reply.find("Content-Type: text/html"), std::string::npos) << reply;
    EXPECT_NE(reply.find("<h1>503"), std::string::npos) << reply;
    EXPECT_EQ(element(listing("folders"), "folderkey"), "");
    EXPECT_EQ(fired(), 1);
    EXPECT_EQ(element(get_over_https(create_folder("a")), "result"), "Success");
    EXPECT_EQ(fired(), 1);
}

TEST_F(AdminProcess, AnswersWithTheBodyThatWasAskedFor)
{
    place({{"kind", "status"}, {"status", 404}, {"content_type", "text/plain"}, {"body", "gone"}});

    const std::string reply = get_over_http(status_path);

    EXPECT_NE(reply.find("Content-Type: text/plain\r\n"), std::string::npos) << reply;
    EXPECT_EQ(body_of(reply), "gone");
}

TEST_F(AdminProcess, AnswersWithoutABodyWhereTheStatusHasNone)
{
    place({{"kind", "status"}, {"status", 304}});

    EXPECT_EQ(body_of(get_over_http(status_path)), "");
}

TEST_F(AdminProcess, LeavesOtherEndpointsAlone)
{
    place({{"kind", "status"}, {"status", 500}, {"path", "/api/folder/"}});

    EXPECT_EQ(element(get_over_http(status_path), "result"), "Success");
    EXPECT_EQ(status_of(get_over_http(create_folder("a"))), "HTTP/1.1 500");
}

TEST_F(AdminProcess, AnswersLaterAndOthersMeanwhile)
{
    place({{"kind", "delay"}, {"milliseconds", 400}, {"path", status_path}});
    socket_client waiting(server->http_port());
    const auto begin = std::chrono::steady_clock::now();

    waiting.send("GET " + status_path + " HTTP/1.1\r\nHost: localhost\r\n\r\n");
    EXPECT_EQ(element(get_over_http(create_folder("a")), "result"), "Success");
    EXPECT_EQ(element(waiting.read_reply(), "result"), "Success");

    EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(400));
}

TEST_F(AdminProcess, CutsAReplyOverTls)
{
    place({{"kind", "cut"}, {"after_bytes", 20}});

    EXPECT_EQ(get_over_https(status_path), "HTTP/1.1 200 OK\r\nSer");
}

TEST_F(AdminProcess, CutsTheBytesOfAFile)
{
    const finished_process put = run_program({"put-content", "--data", data, "--account",
                                              "ann@example.org", "--path", "/a.bin", "--from", "-"},
                                             std::string(300000, 'x'));
    ASSERT_EQ(put.exit_code, 0) << put.errors;
    const std::string key = element(listing("files"), "quickkey");
    const std::string link =
        element(get_over_http("/api/file/get_links.php?link_type=direct_download&quick_key=" + key +
                              "&session_token=" + token),
                "direct_download");
    const std::string path = link.substr(link.find("/download/"));
    place({{"kind", "cut"}, {"after_bytes", 150000}, {"path", "/download/"}, {"count", 1}});

    const std::string cut = get_over_http(path);

    EXPECT_EQ(cut.size(), 150000u);
    EXPECT_NE(cut.find("Content-Length: 300000\r\n"), std::string::npos);
    EXPECT_EQ(body_of(get_over_http(path)).size(), 300000u);
}

TEST_F(AdminProcess, DoesWhatWasAskedAndLosesTheReply)
{
    place({{"kind", "lost-reply"}, {"path", "/api/folder/create.php"}});

    EXPECT_EQ(get_over_https(create_folder("a")), "");

    EXPECT_EQ(element(listing("folders"), "name"), "a");
    EXPECT_EQ(fired(), 1);
}

TEST_F(AdminProcess, TearsAConnectionDownAndDoesNothing)
{
    place({{"kind", "reset"}, {"path", "/api/folder/create.php"}});
    socket_client client(server->http_port());

    client.send("GET " + create_folder("a") + " HTTP/1.1\r\nHost: localhost\r\n\r\n");

    EXPECT_EQ(client.read_to_end(), "");
    EXPECT_TRUE(client.was_reset());
    EXPECT_EQ(element(listing("folders"), "name"), "");
}

TEST_F(AdminProcess, NeverAnswersUntilItEnds)
{
    place({{"kind", "stall"}, {"path", "/api/folder/create.php"}});
    socket_client client(server->http_port());
    client.send("GET " + create_folder("a") + " HTTP/1.1\r\nHost: localhost\r\n\r\n");
    while (fired() == 0) {
    }

    EXPECT_EQ(element(listing("folders"), "name"), "");
    EXPECT_TRUE(client.is_silent());
    EXPECT_EQ(server->stop(SIGTERM), 0);
    EXPECT_EQ(client.read_to_end(), "");
}

TEST_F(AdminProcess, RefusesAnUploadWithAnotherStatus)
{
    place({{"kind", "status"}, {"status", 502}, {"path", "/api/upload/"}, {"count", 1}});

    EXPECT_EQ(status_of(upload("a.txt")), "HTTP/1.1 502");
    EXPECT_EQ(element(listing("files"), "filename"), "");
    EXPECT_EQ(element(upload("a.txt"), "result"), "0");
    EXPECT_EQ(element(listing("files"), "filename"), "a.txt");
}

TEST_F(AdminProcess, TakesAnUploadAndLosesTheReply)
{
    place({{"kind", "lost-reply"}, {"path", "/api/upload/"}});

    EXPECT_EQ(upload("a.txt"), "");

    EXPECT_EQ(element(listing("files"), "filename"), "a.txt");
    EXPECT_EQ(fired(), 1);
}

TEST_F(AdminProcess, PresentsCertificatesThatMustBeRefused)
{
    struct {
        const char *which;
        const char *why;
    } const cases[] = {
        {"expired", "certificate has expired"},
        {"wrong-host", "hostname mismatch"},
        {"self-signed", "self-signed certificate"},
    };
    for (const auto &each : cases) {
        place({{"kind", "certificate"}, {"which", each.which}, {"count", 1}});
        std::string why = refusal_of_certificate();
        for (char &byte : why)
            byte = static_cast<char>(std::tolower(static_cast<unsigned char>(byte)));
        EXPECT_EQ(why, each.why);
        EXPECT_EQ(fired(), 1);
        EXPECT_EQ(refusal_of_certificate(), "") << "it was to be so once";
        ask_admin("DELETE", "/faults");
    }
}

TEST_F(AdminProcess, DoesNoHarmOnceItsFaultsAreRemoved)
{
    place({{"kind", "reset"}});
    place({{"kind", "certificate"}, {"which", "expired"}});

    ask_admin("DELETE", "/faults");

    EXPECT_EQ(element(get_over_https(status_path), "result"), "Success");
}

TEST_F(AdminProcess, EmptiesTheTreesAndLeavesTheFaults)
{
    get_over_http(create_folder("a"));
    place({{"kind", "stall"}, {"path", "/nothing"}});
    ASSERT_EQ(element(listing("folders"), "name"), "a");

    EXPECT_EQ(status_of(ask_admin("POST", "/reset")), "HTTP/1.1 200");

    EXPECT_EQ(element(listing("folders"), "name"), "");
    EXPECT_EQ(told("/faults").at("faults").size(), 1u);
}

TEST_F(AdminProcess, CountsWhatTheServiceWasAsked)
{
    const json before = told("/requests");
    get_over_https(status_path);
    get_over_http(status_path);

    const json after = told("/requests");

    EXPECT_EQ(after.at("total").get<int>(), before.at("total").get<int>() + 2);
    EXPECT_EQ(after.at("endpoints").at(status_path), 2);
    EXPECT_EQ(after.at("endpoints").at("/api/user/get_session_token.php"), 1);
}

TEST_F(AdminProcess, RefusesInJsonWhatIsTooLargeOrNoHttp)
{
    const std::string large = ask_admin("POST", "/faults", std::string(65537, ' '));
    socket_client client(server->admin_port());
    client.send("nonsense\r\n\r\n");
    const std::string malformed = client.read_to_end();

    EXPECT_EQ(status_of(large), "HTTP/1.1 413");
    EXPECT_EQ(json::parse(body_of(large)), json({{"error", "The request is too large"}}));
    EXPECT_EQ(status_of(malformed), "HTTP/1.1 400");
    EXPECT_TRUE(json::parse(body_of(malformed)).contains("error"));
}

TEST_F(AdminProcess, RefusesWhatAWebPageAsks)
{
    socket_client client(server->admin_port());

    client.send("POST /reset HTTP/1.1\r\nHost: localhost\r\nOrigin: https://example.org\r\n"
                "Content-Length: 0\r\nConnection: close\r\n\r\n");

    EXPECT_EQ(status_of(client.read_to_end()), "HTTP/1.1 403");
}
