// The examples that carry bytes up and down.
#include <filesystem>

#include <gmock/gmock.h>

#include "examples/examples_fixture.h"

namespace quillmere_test {
namespace {

using testing::HasSubstr;
using testing::StartsWith;

// No two stretches are alike, so that a lost, doubled or misplaced piece shows.
std::string content_of_length(std::size_t length)
{
    std::string content;
    for (unsigned int number = 0; content.size() < length; ++number)
        content += std::to_string(number * 2654435761U);
    content.resize(length);
    return content;
}

constexpr const char *ten_lines = "10 % sent\n20 % sent\n30 % sent\n40 % sent\n50 % sent\n"
                                  "60 % sent\n70 % sent\n80 % sent\n90 % sent\n100 % sent\n";

std::string line_of(const std::string &text) { return text.substr(0, text.find('\n')); }

} // namespace

class TransferExamples : public Examples {
protected:
    // What the service now holds under the key.
    std::string downloaded(const std::string &key) const
    {
        const std::string target = folder.path_of("downloaded");
        const outcome ended = run("download_file", {key, target});
        EXPECT_EQ(ended.exit_status, 0) << ended.err;
        EXPECT_FALSE(std::filesystem::exists(target + ".part"));
        return content_of(target);
    }
};

TEST_F(TransferExamples, UploadAndDownloadFile)
{
    const std::string content = content_of_length(1 << 20);
    const std::string name = "a (copy)* of 100% caf\xc3\xa9.txt";

    const outcome ended = run("upload_file", {folder.write(name, content)});

    ASSERT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(ended.err, ten_lines);
    const stored_file stored = stored_files().at(name);
    EXPECT_EQ(ended.out, stored.key + "\n");
    EXPECT_EQ(stored.size, "1048576");
    EXPECT_EQ(downloaded(stored.key), content);
}

TEST_F(TransferExamples, UploadFileOfNoBytes)
{
    const outcome ended = run("upload_file", {folder.write("empty", "")});

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(downloaded(line_of(ended.out)), "");
}

TEST_F(TransferExamples, UploadFileUnderATakenName)
{
    put("/a.txt", "theirs");

    const outcome ended = run("upload_file", {folder.write("a.txt", "mine")});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, HasSubstr("uploading failed: 115 The name is taken"));
    EXPECT_EQ(downloaded(stored_files().at("a.txt").key), "theirs");
}

TEST_F(TransferExamples, UploadRevision)
{
    const std::string key = put("/a.txt", "old");
    const std::string content = content_of_length(100'000);
    const std::string based_on = stored_files().at("a.txt").revision;

    const outcome ended = run("upload_revision", {folder.write("new", content), key, based_on});

    ASSERT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_EQ(ended.out, stored_files().at("a.txt").revision + "\n");
    EXPECT_NE(ended.out, based_on + "\n");
    EXPECT_EQ(downloaded(key), content);
}

TEST_F(TransferExamples, UploadRevisionOfWhatSomebodyElseChanged)
{
    const std::string key = put("/a.txt", "old");
    const std::string based_on = stored_files().at("a.txt").revision;
    put("/a.txt", "theirs");

    const outcome ended = run("upload_revision", {folder.write("new", "mine"), key, based_on});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, StartsWith("uploading failed: 127 "));
    EXPECT_EQ(downloaded(key), "theirs");
}

TEST_F(TransferExamples, DownloadFileWithoutContent)
{
    library_on_service library(service);
    char *message = nullptr;
    char *key = nullptr;
    EXPECT_EQ(create_file(library.session_of(account_email).c_str(), "a.txt", nullptr, nullptr,
                          nullptr, &key, &message),
              QM_OK)
        << taken(message);
    const std::string target = folder.path_of("target");

    const outcome ended = run("download_file", {taken(key), target});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, StartsWith("linking failed: 118 "));
    EXPECT_FALSE(std::filesystem::exists(target));
}

class ScriptedTransferExamples : public ExamplesOnScriptedService {
protected:
    // Signs everybody in, and links to wherever it is told.
    connection_script login = answering(xml_reply("<response><session_token>t</session_token>"
                                                  "<result>Success</result></response>"));
    connection_script link = answering(xml_reply(
        "<response><links><link><quickkey>k</quickkey><direct_download>" + server.base_url() +
        "/download/of/a/file</direct_download></link></links>"
        "<result>Success</result></response>"));
    temporary_folder folder;
};

TEST_F(ScriptedTransferExamples, DownloadThatIsCutLeavesNothing)
{
    server.next({login, link, [](connection &client) {
                     client.read_request();
                     client.send("HTTP/1.1 200 OK\r\nContent-Length: 10\r\n\r\n12345");
                 }});
    const std::string target = folder.path_of("target");

    const outcome ended = run("download_file", {"k", target});

    EXPECT_EQ(ended.exit_status, 1);
    EXPECT_THAT(ended.err, StartsWith("fetching failed: "));
    EXPECT_TRUE(std::filesystem::is_empty(folder.path()));
}

TEST_F(ScriptedTransferExamples, DownloadOfAnErrorPageIsNone)
{
    server.next({login, link, answering(http_reply(403, "sorry"))});
    const std::string target = folder.path_of("target");

    EXPECT_EQ(run("download_file", {"k", target}).exit_status, 1);
    EXPECT_TRUE(std::filesystem::is_empty(folder.path()));
}

// Over TLS uploads go to port 443 alone, where no emulator may listen: here a script does, at an
// address that no other test has.
class UploadExamplesOverTls : public testing::Test {
protected:
    static std::string answer(const request &asked)
    {
        if (asked.path() == "/api/user/get_session_token.php")
            return xml_reply("<response><session_token>t</session_token>"
                             "<result>Success</result></response>");
        if (asked.path() == "/api/file/get_info.php")
            return xml_reply("<response><file_info><revision>9</revision><hash>" + hash_ +
                             "</hash></file_info><result>Success</result></response>");
        hash_ = asked.parameter("target_hash").value_or("");
        return xml_reply("<response><key>k</key><result>0</result></response>");
    }

    // False if this system does not let us have the port.
    bool start()
    {
        const std::string address = address_of_this_process();
        try {
            server.emplace(
                on_port(443, on_address(address, tls_with(test_root().issue({{address}})))));
        } catch (const std::system_error &refusal) {
            if (refusal.code() != std::errc::permission_denied)
                throw;
            return false;
        }
        server->answer_with(answer);
        return true;
    }

    outcome run(const std::string &name, std::vector<std::string> arguments) const
    {
        const std::string base = "https://" + address_of_this_process();
        return run_example(name, std::move(arguments),
                           example_environment(base, base, test_root_path()));
    }

    static inline std::string hash_;
    std::optional<scripted_server> server;
    temporary_folder folder;
    proxyless_environment environment;
};

TEST_F(UploadExamplesOverTls, SendWholeFiles)
{
    if (!start())
        GTEST_SKIP() << "port 443 may not be bound here";
    const std::string content = content_of_length(1 << 20);
    const std::string path = folder.write("a.txt", content);

    const outcome uploaded = run("upload_file", {path});
    const outcome revised = run("upload_revision", {path, "k", "8"});

    EXPECT_EQ(uploaded.exit_status, 0) << uploaded.out << uploaded.err;
    EXPECT_EQ(revised.exit_status, 0) << revised.out << revised.err;
    ASSERT_EQ(server->requests().size(), 5u);
    EXPECT_TRUE(server->requests()[1].body == content);
    EXPECT_TRUE(server->requests()[3].body == content);
}

} // namespace quillmere_test
