// Uploads, taken piece by piece as a connection hands them on.
#include <memory>

#include "digest.h"
#include "socket_client.h"
#include "store/accounts.h"
#include "tree_fixture.h"
#include "uploads.h"

using namespace emulator;

namespace {

std::string hash_of(const std::string &bytes)
{
    sha256_sum sum;
    sum.add(bytes);
    return sum.finish_hex();
}

std::string digest_of(const std::string &bytes)
{
    const std::string raw = sha256(bytes);
    std::string text(44, '\0');
    std::string with_end(45, '\0');
    EVP_EncodeBlock(reinterpret_cast<unsigned char *>(with_end.data()),
                    reinterpret_cast<const unsigned char *>(raw.data()),
                    static_cast<int>(raw.size()));
    return "sha-256=:" + with_end.substr(0, 44) + ":";
}

class Upload : public Tree {
protected:
    request head(const pairs &given, const std::string &name, const std::string &bytes)
    {
        request made{"POST", "/api/upload/upload.php?type=desktop&session_token=" + sessions[ann],
                     {},     {},
                     {},     {},
                     {}};
        for (const auto &[parameter, value] : given)
            made.target += "&" + parameter + "=" + value;
        made.content_disposition = "attachment; filename=\"" + name + "\"";
        made.content_digest = digest_of(bytes);
        made.content_length = bytes.size();
        return made;
    }

    reply send(const request &with, const std::string &bytes)
    {
        const std::unique_ptr<body_receiver> receiver = receive_upload(with, state);
        for (std::size_t at = 0; at < bytes.size() && !receiver->is_refused(); at += 3)
            receiver->take(std::string_view(bytes).substr(at, 3));
        return receiver->answer();
    }

    std::string error_in(const request &with, const std::string &bytes)
    {
        return element(send(with, bytes).body, "error");
    }

    /** Refused by the header alone, before a byte has been sent. */
    std::string early_error_in(const request &with)
    {
        const std::unique_ptr<body_receiver> receiver = receive_upload(with, state);
        return receiver->is_refused() ? element(receiver->answer().body, "error") : "";
    }

    std::string put(const std::string &name, const std::string &bytes, const pairs &given = {})
    {
        const reply made = send(head(given, name, bytes), bytes);
        EXPECT_EQ(made.http_status, 200u) << made.body;
        return element(made.body, "key");
    }

    pairs revising(const std::string &key, const std::string &bytes)
    {
        return {{"quickkey", key},
                {"revision", file_says(key, "revision")},
                {"target_hash", hash_of(bytes)},
                {"target_size", std::to_string(bytes.size())}};
    }

    std::string bytes_in(const std::string &key)
    {
        const std::string link =
            element(ask(ann, "file/get_links", {{"quick_key", key}}).body, "normal_download");
        return bytes_of(fetch(path_of(link)));
    }

    /** Files of the content folder, whole or begun. */
    std::size_t stored_files()
    {
        std::size_t count = 0;
        for (const auto &each :
             std::filesystem::recursive_directory_iterator(scratch.path() / "content"))
            count += each.is_regular_file();
        return count;
    }
};

} // namespace

TEST_F(Upload, MakesAFileInTheRoot)
{
    const std::string key = put("a.txt", "some bytes");

    EXPECT_EQ(names_in(""), std::vector<std::string>{"a.txt"});
    EXPECT_EQ(bytes_in(key), "some bytes");
    EXPECT_EQ(file_says(key, "size"), "10");
    EXPECT_EQ(file_says(key, "hash"), hash_of("some bytes"));
}

TEST_F(Upload, MakesAFileInAFolder)
{
    const std::string folder = make_folder("photos");

    const std::string key = put("a.txt", "x", {{"folder_key", folder}});

    EXPECT_EQ(names_in(folder), std::vector<std::string>{"a.txt"});
    EXPECT_EQ(file_says(key, "parent_folderkey"), folder);
}

TEST_F(Upload, AnswersWithANumberAsItsResult)
{
    const reply made = send(head({}, "a.txt", "x"), "x");

    const std::string key = element(made.body, "key");
    EXPECT_EQ(made.body, "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                         "<response><action>upload/upload</action><key>" +
                             key +
                             "</key><result>0</result>"
                             "<current_api_version>2.13</current_api_version></response>");
}

TEST_F(Upload, AnswersARefusalInTheUsualEnvelope)
{
    put("a.txt", "x");

    const reply made = send(head({}, "a.txt", "x"), "x");

    EXPECT_EQ(made.http_status, 409u);
    EXPECT_EQ(made.body, "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                         "<response><action>upload/upload</action>"
                         "<message>The name is taken in that folder</message><error>115</error>"
                         "<result>Error</result>"
                         "<current_api_version>2.13</current_api_version></response>");
}

TEST_F(Upload, OfNoBytesMakesAFileWithContent)
{
    const std::string key = put("empty", "");

    EXPECT_EQ(file_says(key, "hash"), hash_of(""));
    EXPECT_EQ(file_says(key, "size"), "0");
}

TEST_F(Upload, IsSeenInTheFeed)
{
    const std::uint64_t before = revision();

    const std::string key = put("a.txt", "x");

    const std::string changes =
        ask("device/get_changes", {{"revision", std::to_string(before)}, {"device_id", "0"}}).body;
    EXPECT_EQ(element(element(changes, "updated"), "quickkey"), key);
}

TEST_F(Upload, OfTheSameContentStoresItOnce)
{
    put("a.txt", "the same");
    put("b.txt", "the same");

    EXPECT_EQ(stored_files(), 1u);
}

TEST_F(Upload, OfANewRevisionReplacesTheContent)
{
    const std::string key = put("a.txt", "old");
    const std::uint64_t before = revision();

    const std::string same = put("ignored", "newer", revising(key, "newer"));

    EXPECT_EQ(same, key);
    EXPECT_EQ(bytes_in(key), "newer");
    EXPECT_EQ(names_in(""), std::vector<std::string>{"a.txt"});
    EXPECT_EQ(revision(), before + 1);
    EXPECT_EQ(file_says(key, "revision"), std::to_string(before + 1));
}

TEST_F(Upload, OfANewRevisionNeedsNeitherNameNorDigestInItsHeader)
{
    const std::string key = put("a.txt", "old");
    request bare = head(revising(key, "newer"), "", "newer");
    bare.content_disposition.clear();
    bare.content_digest.clear();

    EXPECT_EQ(send(bare, "newer").http_status, 200u);
    EXPECT_EQ(bytes_in(key), "newer");
}

TEST_F(Upload, OnAnEarlierRevisionIsRefused)
{
    const std::string key = put("a.txt", "old");
    const pairs based_on_old = revising(key, "mine");
    put("", "theirs", revising(key, "theirs"));

    EXPECT_EQ(early_error_in(head(based_on_old, "", "mine")), "127");
    EXPECT_EQ(bytes_in(key), "theirs");
}

TEST_F(Upload, IsRefusedWhenTheFileChangesWhileItIsSent)
{
    const std::string key = put("a.txt", "old");
    const auto slow = receive_upload(head(revising(key, "mine"), "", "mine"), state);
    slow->take("mi");
    put("", "theirs", revising(key, "theirs"));

    slow->take("ne");

    EXPECT_EQ(element(slow->answer().body, "error"), "127");
    EXPECT_EQ(bytes_in(key), "theirs");
}

TEST_F(Upload, IsRefusedWhenItsNameIsTakenWhileItIsSent)
{
    const auto slow = receive_upload(head({}, "a.txt", "mine"), state);
    slow->take("mine");
    put("a.txt", "theirs");

    EXPECT_EQ(element(slow->answer().body, "error"), "115");
}

TEST_F(Upload, FillsAFileThatHasNoContentYet)
{
    const std::string key = make_file("a.txt");

    EXPECT_EQ(put("", "bytes", {{"uploadkey", key}}), key);

    EXPECT_EQ(bytes_in(key), "bytes");
    EXPECT_EQ(early_error_in(head({{"uploadkey", key}}, "", "other")), "129");
}

TEST_F(Upload, IsRefusedBeforeItsBytesAreSent)
{
    const std::string file = put("a.txt", "x");
    const std::string foreign = make_folder("b", {}, bob);
    const auto without = [this](const char *parameter, pairs given) {
        for (auto &each : given)
            if (each.first == parameter)
                each.first = "not_" + each.first;
        return early_error_in(head(given, "b.txt", "y"));
    };

    EXPECT_EQ(early_error_in(head({}, "a.txt", "x")), "115");
    EXPECT_EQ(early_error_in(head({{"folder_key", "unknown"}}, "b.txt", "x")), "112");
    EXPECT_EQ(early_error_in(head({{"folder_key", foreign}}, "b.txt", "x")), "114");
    EXPECT_EQ(early_error_in(head({{"uploadkey", "unknown"}}, "b.txt", "x")), "113");
    EXPECT_EQ(early_error_in(head({}, "a%", "x")), "");
    EXPECT_EQ(early_error_in(head({}, "..", "x")), "106");
    EXPECT_EQ(early_error_in(head({}, "a/b", "x")), "106");
    EXPECT_EQ(early_error_in(head({}, "\xff", "x")), "106");
    EXPECT_EQ(without("revision", revising(file, "y")), "104");
    EXPECT_EQ(without("target_hash", revising(file, "y")), "104");
    EXPECT_EQ(without("target_size", revising(file, "y")), "104");
}

TEST_F(Upload, NeedsASession)
{
    request anonymous = head({}, "a.txt", "x");
    anonymous.target = "/api/upload/upload.php?type=desktop";
    EXPECT_EQ(early_error_in(anonymous), "105");
    anonymous.target += "&session_token=unknown";
    EXPECT_EQ(early_error_in(anonymous), "105");
}

TEST_F(Upload, NeedsANameAndADigest)
{
    request nameless = head({}, "a.txt", "x");
    nameless.content_disposition.clear();
    request undigested = head({}, "a.txt", "x");
    undigested.content_digest = "sha-512=:AAAA:";

    EXPECT_EQ(early_error_in(nameless), "104");
    EXPECT_EQ(early_error_in(undigested), "104");
    undigested.repr_digest = digest_of("x");
    EXPECT_EQ(send(undigested, "x").http_status, 200u);
}

TEST_F(Upload, IsAPostAlone)
{
    request got = head({}, "a.txt", "");
    got.method = "GET";

    const reply made = send(got, "");

    EXPECT_EQ(element(made.body, "error"), "102");
    EXPECT_EQ(field_of(made, "Allow"), "POST");
}

TEST_F(Upload, OfOtherBytesThanAnnouncedIsRefusedAndForgotten)
{
    const std::string key = put("a.txt", "old");
    request chunked = head({}, "b.txt", "bytes");
    chunked.content_length.reset();
    request contradictory = head({}, "b.txt", "bytes");
    contradictory.repr_digest = digest_of("others");

    EXPECT_EQ(error_in(head({}, "b.txt", "bytes"), "other"), "128");
    EXPECT_EQ(error_in(chunked, "other"), "128");
    EXPECT_EQ(early_error_in(contradictory), "128");
    EXPECT_EQ(error_in(head(revising(key, "bytes"), "", "other"), "other"), "128");
    EXPECT_EQ(early_error_in(head(revising(key, "bytes"), "", "longer bytes")), "128");
    EXPECT_EQ(names_in(""), std::vector<std::string>{"a.txt"});
    EXPECT_EQ(stored_files(), 1u);
}

TEST_F(Upload, InChunksMayNotOutgrowTheRevisionAnnounced)
{
    const std::string key = put("a.txt", "old");
    request chunked = head(revising(key, "bytes"), "", "bytes");
    chunked.content_length.reset();

    const auto receiver = receive_upload(chunked, state);
    receiver->take("bytes");
    EXPECT_FALSE(receiver->is_refused());
    receiver->take("!");

    EXPECT_TRUE(receiver->is_refused());
    EXPECT_EQ(element(receiver->answer().body, "error"), "128");
}

TEST_F(Upload, BeyondTheStorageOfTheAccountIsRefused)
{
    put_account_limits(store, *find_account(store, ann), {10, {}, {}});
    request chunked = head({}, "a.txt", "eleven bytes");
    chunked.content_length.reset();

    EXPECT_EQ(early_error_in(head({}, "a.txt", "eleven bytes")), "117");
    EXPECT_EQ(error_in(chunked, "eleven bytes"), "117");
    EXPECT_EQ(stored_files(), 0u);
    put("b.txt", "ten bytes!");
}

TEST_F(Upload, BeyondTheSizeLimitIsRefused)
{
    request large = head({}, "a.txt", "");
    large.content_length = (std::uint64_t{4} << 30) + 1;

    EXPECT_EQ(early_error_in(large), "110");
}

TEST_F(Upload, ThatEndsEarlyLeavesNothing)
{
    {
        const auto cut = receive_upload(head({}, "a.txt", "bytes"), state);
        cut->take("byt");
        EXPECT_EQ(stored_files(), 1u);
    }

    EXPECT_EQ(stored_files(), 0u);
    EXPECT_EQ(names_in(""), std::vector<std::string>{});
}
