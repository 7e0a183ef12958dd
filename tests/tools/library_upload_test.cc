// The library's upload connection, its addresses and its reading of replies against the real local
// service, as an application uses them.
#include <quillmere.h>

#include <string>

#include <gtest/gtest.h>

#include "support/globals_guard.h"
#include "support/stdout_capture.h"
#include "transfer_account.h"
#include "transfers/sha256.h"
#include "transport/upload_connection.h"

namespace quillmere_test {
namespace {

using quillmere::tools::base64_of;

struct freed {
    void operator()(char *text) const { api_free(text); }
};
using owned_text = std::unique_ptr<char, freed>;

std::string raw_digest_of(const std::string &bytes)
{
    quillmere::tools::sha256_sum sum;
    sum.add(bytes);
    return sum.finish();
}

class LibraryUpload : public transfer_account {
protected:
    LibraryUpload()
    {
        const nlohmann::json ready = nlohmann::json::parse(content_of(ready_file));
        upload_address =
            ready.at("http_url").get<std::string>() + "/api/upload/upload.php?type=desktop";
        urls[2] = upload_address.c_str();
        token = nlohmann::json::parse(content_of(home.session_path())).at("session_token");
    }

    /** What parse_upload_response() makes of the reply; the key goes to the member. */
    std::int32_t send(const std::string &url, const std::string &bytes, const std::string &fields)
    {
        const std::string::size_type path = url.find('/', url.find("://") + 3);
        const opened made = open_connection(url.c_str(), 0, 10);
        EXPECT_EQ(made.result, 0);
        const std::string head = "POST " + url.substr(path) +
                                 " HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n"
                                 "Content-Length: " +
                                 std::to_string(bytes.size()) + "\r\n" + fields + "\r\n";
        EXPECT_EQ(write_all(made.connection.get(), head + bytes), "");
        const std::string reply = read_all(made.connection.get()).bytes;
        char *received = nullptr;
        const std::int32_t result = parse_upload_response(reply.data(), reply.size(), &received);
        const owned_text owned(received);
        key = received ? received : "";
        return result;
    }

    globals_guard globals;
    std::string upload_address;
    std::string token;
    std::string key;
};

} // namespace

TEST_F(LibraryUpload, MakesAFile)
{
    const std::string bytes = some_bytes(1'000'000);
    const owned_text url(get_upload_url(token.c_str(), nullptr, 0));

    const std::int32_t result =
        send(url.get(), bytes,
             "Content-Disposition: attachment; filename=\"a.bin\"\r\nContent-Digest: sha-256=:" +
                 base64_of(raw_digest_of(bytes)) + ":\r\n");

    EXPECT_EQ(result, 0);
    EXPECT_EQ(result_of({"stat", "/a.bin"}).at("key"), key);
    EXPECT_EQ(remote_sha256("/a.bin"), sha256_of(bytes));
}

TEST_F(LibraryUpload, MakesARevision)
{
    put_content("/a.bin", "old");
    const nlohmann::json old = result_of({"stat", "/a.bin"});
    const std::string bytes = some_bytes(70'000);
    const owned_text url(
        get_patch_upload_url(token.c_str(), old.at("key").get<std::string>().c_str(),
                             old.at("revision"), sha256_of(bytes).c_str(), bytes.size(), 0));

    EXPECT_EQ(send(url.get(), bytes, ""), 0);
    EXPECT_EQ(key, old.at("key"));
    EXPECT_EQ(remote_sha256("/a.bin"), sha256_of(bytes));

    EXPECT_EQ(send(url.get(), bytes, ""), -1) << "the revision is no longer the current one";
    EXPECT_EQ(key, "");
}

TEST_F(LibraryUpload, FillsAFileThatWasCreated)
{
    const std::string quick_key = result_of({"create", "/a.bin"}).at("key");
    const owned_text url(get_upload_url(token.c_str(), quick_key.c_str(), 0));

    EXPECT_EQ(send(url.get(), "abc",
                   "Repr-Digest: sha-256=:" + base64_of(raw_digest_of("abc")) + ":\r\n"),
              0);

    EXPECT_EQ(key, quick_key);
    EXPECT_EQ(remote_sha256("/a.bin"), sha256_of("abc"));
}

} // namespace quillmere_test
