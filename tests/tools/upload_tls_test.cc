// Uploads over TLS, which the library sends to port 443 alone, and replies of every kind.
#include <memory>
#include <system_error>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "some_content.h"
#include "support/certificates.h"
#include "support/scripted_server.h"
#include "terminal.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;
using testing::Not;

const std::string nothing = xml_reply("<response><result>Success</result></response>");
const std::string accepted = xml_reply("<response><key>file</key><result>0</result></response>");

/** Reads an upload as a server must that was asked first: the header, and then the bytes. */
request read_upload(connection &client, const std::string &answer_to_header)
{
    std::string bytes;
    while (bytes.find("\r\n\r\n") == std::string::npos)
        bytes += client.read_some();
    const std::size_t end = bytes.find("\r\n\r\n") + 4;
    request asked = parse_request_head(bytes.substr(0, end));
    asked.body = bytes.substr(end);
    client.send(answer_to_header);
    const std::size_t size = std::stoul(asked.header("Content-Length").value_or("0"));
    while (asked.body.size() < size)
        asked.body += client.read_some();
    return asked;
}

class UploadOverTls : public testing::Test {
protected:
    /** False where the port is not to be had. */
    bool start()
    {
        try {
            const certificate leaf = test_root().issue({{address}});
            server = std::make_unique<scripted_server>(
                on_port(443, on_address(address, tls_with(leaf))));
        } catch (const std::system_error &) {
            return false;
        }
        home.environment["QUILLMERE_SERVICE"] = base;
        home.environment["SSL_CERT_FILE"] = test_root_path();
        home.sign_in(base, "token");
        return true;
    }

    /** The root is empty: two listings, and then the upload. */
    void on_upload(const connection_script &uploaded)
    {
        const auto listing = answering(nothing);
        server->next({listing, listing, uploaded});
    }

    outcome put(const std::string &bytes)
    {
        return home.run({"put", "--retries", "0", home.folder().write("file", bytes), "/"});
    }

    const std::string address = address_of_this_process();
    const std::string base = "https://" + address;
    program_home home;
    std::unique_ptr<scripted_server> server;
};

} // namespace

TEST_F(UploadOverTls, IsAPlainPostWithNameAndDigest)
{
    if (!start())
        GTEST_SKIP() << "port 443 is not to be had";
    on_upload(answering(accepted));

    const outcome ended = put("abc");

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_THAT(ended.err, Not(HasSubstr("unencrypted")));
    const request asked = server->requests().back();
    EXPECT_EQ(asked.method, "POST");
    EXPECT_EQ(asked.target, "/api/upload/upload.php?type=desktop&session_token=token");
    EXPECT_EQ(asked.header("Host"), address);
    EXPECT_EQ(asked.header("Content-Disposition"), "attachment; filename*=UTF-8''file");
    EXPECT_EQ(asked.header("Content-Digest"),
              "sha-256=:ungWv48Bz+pBQUDeXa4iI7ADYaOWF3qctBD/YfIAFa0=:");
    EXPECT_EQ(asked.body, "abc");
}

TEST_F(UploadOverTls, OfMuchAsksFirst)
{
    if (!start())
        GTEST_SKIP() << "port 443 is not to be had";
    const std::string bytes = some_bytes(3'000'000);
    std::string arrived;
    on_upload([&](connection &client) {
        arrived = read_upload(client, "HTTP/1.1 100 Continue\r\n\r\n").body;
        client.send(accepted);
    });

    const outcome ended = put(bytes);

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(sha256_of(arrived), sha256_of(bytes));
}

TEST_F(UploadOverTls, ThatIsRefusedSendsNothing)
{
    if (!start())
        GTEST_SKIP() << "port 443 is not to be had";
    std::string more;
    on_upload([&](connection &client) {
        std::string head;
        while (head.find("\r\n\r\n") == std::string::npos)
            head += client.read_some();
        client.send(http_reply(403, "<response><result>Error</result><error>117</error>"
                                    "<message>It is full</message></response>"));
        more = client.read_some();
    });

    const outcome ended = put(some_bytes(3'000'000));

    EXPECT_EQ(ended.exit_status, 3);
    EXPECT_THAT(ended.err, HasSubstr("failed: 117: It is full"));
    ASSERT_TRUE(server->wait_until_idle());
    EXPECT_EQ(more, "");
}

TEST_F(UploadOverTls, GivesWayToCtrlC)
{
    if (!start())
        GTEST_SKIP() << "port 443 is not to be had";
    on_upload([&](connection &client) {
        client.send(client.read_some().empty() ? "" : "HTTP/1.1 100 Continue\r\n\r\n");
        client.stall();
    });
    terminal_program program(
        home.with({"put", home.folder().write("file", some_bytes(3'000'000)), "/"}));
    program.wait_for("file    0%");

    program.type("\x03");

    EXPECT_EQ(program.wait(), 130);
    EXPECT_TRUE(server->wait_until_idle());
}

TEST_F(UploadOverTls, MeetsRepliesOfEveryKind)
{
    if (!start())
        GTEST_SKIP() << "port 443 is not to be had";
    const struct {
        std::string reply;
        int exit_status;
        const char *said;
    } rows[] = {
        {"HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n"
         "2a\r\n<response><result>0</result></response>   \r\n0\r\n\r\n",
         0, ""},
        {http_reply(502, "<html><p>Bad gateway</html>"), 7, "HTTP 502"},
        {http_reply(404, ""), 6, "HTTP 404"},
        {http_reply(200, "<response><result>5</result></response>"), 6, "no API reply"},
        {http_reply(403, "<response><result>Error</result><error>105</error></response>"), 4,
         "sign in again"},
        {"nonsense", 5, "no answer from"},
        {"", 5, "no answer from"},
    };
    for (const auto &row : rows) {
        on_upload(answering(row.reply));

        const outcome ended = put("abc");

        EXPECT_EQ(ended.exit_status, row.exit_status) << row.reply << ended.err;
        EXPECT_THAT(ended.err, HasSubstr(row.said)) << row.reply;
    }
}

} // namespace quillmere_test
