// The addresses that uploads go to, and the replies that they come back with.
#include <gtest/gtest.h>

#include <optional>

#include "support/globals_guard.h"
#include "support/log_capture.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

struct text_deleter {
    void operator()(char *text) const { api_free(text); }
};
using owned_text = std::unique_ptr<char, text_deleter>;

// A token as the service might send it, and every byte that encoding would change.
constexpr const char *token = "a token&=?#%+/\xc3\xa9";

class UploadUrl : public testing::Test {
protected:
    UploadUrl()
    {
        urls[0] = "http://base.example";
        urls[1] = "https://base.example";
        urls[2] = "http://plain.example/up?type=desktop";
        urls[3] = "https://encrypted.example/up?type=desktop";
    }

    globals_guard globals;
    log_capture log;
};

TEST_F(UploadUrl, IsTheUploadAddressWithTheTokenAlone)
{
    owned_text url(get_upload_url("t", nullptr, 1));

    EXPECT_STREQ(url.get(), "https://encrypted.example/up?type=desktop&session_token=t");
}

TEST_F(UploadUrl, IsUnencryptedWithoutTheFlag)
{
    owned_text url(get_upload_url("t", nullptr, 0));

    EXPECT_STREQ(url.get(), "http://plain.example/up?type=desktop&session_token=t");
}

TEST_F(UploadUrl, IsEncryptedWithAnyFlagButZero)
{
    for (int32_t flag : {1, 2, -1, INT32_MIN}) {
        owned_text url(get_upload_url("t", nullptr, flag));
        EXPECT_STREQ(url.get(), "https://encrypted.example/up?type=desktop&session_token=t");
        owned_text patch(get_patch_upload_url("t", "q", 1, "h", 2, flag));
        EXPECT_EQ(std::string(patch.get()).substr(0, 8), "https://");
    }
}

TEST_F(UploadUrl, EndsInTheUploadKey)
{
    owned_text url(get_upload_url("t", "k", 0));

    EXPECT_STREQ(url.get(), "http://plain.example/up?type=desktop&session_token=t&uploadkey=k");
}

TEST_F(UploadUrl, HasAnEmptyUploadKeyToo)
{
    owned_text url(get_upload_url("", "", 0));

    EXPECT_STREQ(url.get(), "http://plain.example/up?type=desktop&session_token=&uploadkey=");
}

TEST_F(UploadUrl, EncodesNothing)
{
    owned_text url(get_upload_url(token, token, 0));

    EXPECT_EQ(std::string(url.get()), std::string("http://plain.example/up?type=desktop") +
                                          "&session_token=" + token + "&uploadkey=" + token);
}

TEST_F(UploadUrl, IsNoneWithoutAToken)
{
    EXPECT_EQ(get_upload_url(nullptr, "k", 0), nullptr);
    EXPECT_EQ(get_upload_url(nullptr, nullptr, 1), nullptr);
    EXPECT_EQ(get_patch_upload_url(nullptr, "q", 1, "h", 2, 0), nullptr);
    EXPECT_EQ(get_patch_upload_url(nullptr, "q", 1, "h", 2, 1), nullptr);
}

TEST_F(UploadUrl, MayBeOfAnyLength)
{
    const std::string longer(1000, 'l');

    owned_text url(get_upload_url(longer.c_str(), longer.c_str(), 0));

    EXPECT_EQ(url.get(), "http://plain.example/up?type=desktop&session_token=" + longer +
                             "&uploadkey=" + longer);
}

TEST_F(UploadUrl, OfARevisionHasItsParametersInOrder)
{
    owned_text url(get_patch_upload_url("t", "q", 0, "h", 4096, 1));

    EXPECT_STREQ(url.get(), "https://encrypted.example/up?type=desktop&session_token=t&quickkey=q"
                            "&revision=0&target_hash=h&target_size=4096");
}

TEST_F(UploadUrl, OfARevisionIsUnencryptedWithoutTheFlag)
{
    owned_text url(get_patch_upload_url("t", "q", 7, "h", 0, 0));

    EXPECT_STREQ(url.get(), "http://plain.example/up?type=desktop&session_token=t&quickkey=q"
                            "&revision=7&target_hash=h&target_size=0");
}

TEST_F(UploadUrl, OfARevisionTakesTheLargestNumbers)
{
    owned_text url(get_patch_upload_url("", "", UINT64_MAX, "", UINT64_MAX, 0));

    EXPECT_STREQ(url.get(), "http://plain.example/up?type=desktop&session_token=&quickkey="
                            "&revision=18446744073709551615&target_hash="
                            "&target_size=18446744073709551615");
}

TEST_F(UploadUrl, OfARevisionEncodesNothing)
{
    owned_text url(get_patch_upload_url(token, token, 1, token, 2, 0));

    EXPECT_EQ(std::string(url.get()),
              std::string("http://plain.example/up?type=desktop&session_token=") + token +
                  "&quickkey=" + token + "&revision=1&target_hash=" + token + "&target_size=2");
}

TEST_F(UploadUrl, IsNotLogged)
{
    owned_text url(get_upload_url("t", "k", 0));
    owned_text patch(get_patch_upload_url("t", "q", 0, "h", 4096, 1));

    EXPECT_EQ(log.text(), "");
}

TEST(UploadUrlAtFirst, IsOnTheServicesUploadPath)
{
    owned_text plain(get_upload_url("t", nullptr, 0));
    owned_text encrypted(get_upload_url("t", nullptr, 1));

    EXPECT_EQ(plain.get(),
              std::string(urls[0]) + "/api/upload/upload.php?type=desktop&session_token=t");
    EXPECT_EQ(encrypted.get(),
              std::string(urls[1]) + "/api/upload/upload.php?type=desktop&session_token=t");
}

constexpr const char *head = "HTTP/1.1 200 OK\r\nContent-Type: text/xml\r\n\r\n";

std::string body_with(const std::string &elements)
{
    return "<response><doupload>" + elements + "</doupload></response>";
}

struct upload_reply {
    const char *name;
    std::string reply;
    int32_t result;
    std::optional<std::string> key;
};

void PrintTo(const upload_reply &each, std::ostream *out) { *out << each.name; }

struct parsed {
    int32_t result;
    std::optional<std::string> key;
};

// The key holds rubbish before the call. The reply stands without a NUL behind it, which
// a sanitizer sees to.
parsed parse(const std::string &reply)
{
    char rubbish[] = "rubbish";
    char *key = rubbish;
    const std::vector<char> bytes(reply.begin(), reply.end());
    int32_t result = parse_upload_response(bytes.data(), bytes.size(), &key);
    owned_text owned(key);
    return {result, key ? std::optional<std::string>(key) : std::nullopt};
}

class UploadReply : public testing::TestWithParam<upload_reply> {
protected:
    globals_guard globals;
    log_capture log;
};

TEST_P(UploadReply, IsReadWithItsKey)
{
    parsed read = parse(GetParam().reply);

    EXPECT_EQ(read.result, GetParam().result);
    EXPECT_EQ(read.key, GetParam().key);
}

TEST_P(UploadReply, IsLoggedOnlyWhenItIsDamaged)
{
    parse(GetParam().reply);

    EXPECT_EQ(log.text().empty(), GetParam().result != QM_MALFORMED_REPLY);
}

const upload_reply judged_replies[] = {
    {"accepted", head + body_with("<result>0</result><key>abc</key>"), 0, "abc"},
    {"refused", head + body_with("<result>1</result><key>abc</key>"), -1, "abc"},
    {"accepted without a key", head + body_with("<result>0</result>"), 0, std::nullopt},
    {"refused without a key", head + body_with("<result>-20</result>"), -1, std::nullopt},
    {"with an empty key", head + body_with("<result>0</result><key/>"), 0, std::nullopt},
    {"with an empty result", head + body_with("<result/><key>abc</key>"), -1, "abc"},
    {"without a result", head + body_with("<key>abc</key>"), -1, "abc"},
    {"with neither", head + body_with(""), -1, std::nullopt},
    {"without a head", body_with("<result>0</result><key>abc</key>"), 0, "abc"},
    {"with the key first", head + body_with("<key>abc</key><result>0</result>"), 0, "abc"},
    {"with two keys", head + body_with("<key>a</key><result>0</result><key>b</key>"), 0, "ab"},
    {"with elements at the root", head + std::string("<key>abc</key>"), -1, "abc"},
    {"with the result as root", head + std::string("<result>0</result>"), 0, std::nullopt},
};
INSTANTIATE_TEST_SUITE_P(Judged, UploadReply, testing::ValuesIn(judged_replies));

// A result counts if its first character is 0, and is then read as a number.
const upload_reply number_replies[] = {
    {"00", body_with("<result>00</result>"), 0, std::nullopt},
    {"0x1", body_with("<result>0x1</result>"), 0, std::nullopt},
    {"0 and more", body_with("<result>0 then</result>"), 0, std::nullopt},
    {"012", body_with("<result>012</result>"), 12, std::nullopt},
    {"two results", body_with("<result>0</result><result>7</result>"), 7, std::nullopt},
    {"a space", body_with("<result> 0</result>"), -1, std::nullopt},
    {"a sign", body_with("<result>-0</result>"), -1, std::nullopt},
    {"a plus", body_with("<result>+0</result>"), -1, std::nullopt},
    {"a word", body_with("<result>Success</result>"), -1, std::nullopt},
    {"10", body_with("<result>10</result>"), -1, std::nullopt},
};
INSTANTIATE_TEST_SUITE_P(Numbers, UploadReply, testing::ValuesIn(number_replies));

const upload_reply short_replies[] = {
    {"nothing", "", -1, std::nullopt},
    {"a byte", "<", -1, std::nullopt},
    {"three bytes", "\r\n\r", -1, std::nullopt},
    {"three bytes of a document", "<a>", -1, std::nullopt},
};
INSTANTIATE_TEST_SUITE_P(Short, UploadReply, testing::ValuesIn(short_replies));

const upload_reply separated_replies[] = {
    {"the separator alone", "\r\n\r\n", QM_MALFORMED_REPLY, std::nullopt},
    {"four bytes of a document", "<a/>", -1, std::nullopt},
    {"a separator at the end", "<a/>\r\n\r\n", -1, std::nullopt},
    {"a head with nothing behind it", head, QM_MALFORMED_REPLY, std::nullopt},
    {"one byte behind the separator", "<a/>\r\n\r\n ", QM_MALFORMED_REPLY, std::nullopt},
    {"a separator at the start", "\r\n\r\n" + body_with("<result>0</result>"), 0, std::nullopt},
    {"another separator in the body", head + body_with("\r\n\r\n<result>0</result>"), 0,
     std::nullopt},
    {"a document and another behind it",
     body_with("<result>1</result>") + "\r\n\r\n" + body_with("<result>0</result>"), 0,
     std::nullopt},
    {"lines without a carriage return", "HTTP/1.1 200 OK\n\n" + body_with("<result>0</result>"),
     QM_MALFORMED_REPLY, std::nullopt},
    {"a separator that is not whole", "HTTP/1.1 200 OK\r\n\r" + body_with("<result>0</result>"),
     QM_MALFORMED_REPLY, std::nullopt},
    {"a NUL in the head",
     std::string("A: \0\r\n\r\n", 8) + body_with("<result>0</result><key>k</key>"), 0, "k"},
};
INSTANTIATE_TEST_SUITE_P(Separated, UploadReply, testing::ValuesIn(separated_replies));

const upload_reply damaged_replies[] = {
    {"no document", head + std::string("no document"), QM_MALFORMED_REPLY, std::nullopt},
    {"cut off", head + std::string("<response><result>0</result><key>abc</key>"),
     QM_MALFORMED_REPLY, std::nullopt},
    {"cut off in the key", head + std::string("<response><result>0</result><key>ab"),
     QM_MALFORMED_REPLY, std::nullopt},
    {"refused and cut off", head + std::string("<response><result>1</result>"), QM_MALFORMED_REPLY,
     std::nullopt},
    {"more behind the document", head + body_with("<result>0</result>") + "<", QM_MALFORMED_REPLY,
     std::nullopt},
    {"a NUL behind the document", head + body_with("<result>0</result>") + std::string(1, '\0'),
     QM_MALFORMED_REPLY, std::nullopt},
};
INSTANTIATE_TEST_SUITE_P(Damaged, UploadReply, testing::ValuesIn(damaged_replies));

TEST(DamagedUploadReply, IsLoggedOnceALookupWithoutItsHead)
{
    globals_guard globals;
    log_capture log;

    parse(std::string(head) + "<response><result>0</result>");

    const std::string body = "<response><result>0</result>\n";
    EXPECT_EQ(log.text(), "Expat failed parsing a node with error 0\n"
                          "Name of node whose value is sought: result\n"
                          "XML we are searching for this node:\n" +
                              body +
                              "Expat failed parsing a node with error 0\n"
                              "Name of node whose value is sought: key\n"
                              "XML we are searching for this node:\n" +
                              body);
}

TEST(CutUploadReply, IsNeverAccepted)
{
    globals_guard globals;
    log_capture log;
    const std::string whole = head + body_with("<result>0</result><key>abc</key>");
    ASSERT_EQ(parse(whole).result, 0);

    for (size_t length = 0; length < whole.size(); ++length) {
        SCOPED_TRACE(length);
        parsed read = parse(whole.substr(0, length));
        EXPECT_EQ(read.result, length < 4 ? -1 : QM_MALFORMED_REPLY);
        EXPECT_EQ(read.key, std::nullopt);
    }
}

TEST(UnreceivedUploadReply, IsNotAccepted)
{
    char rubbish[] = "rubbish";
    char *key = rubbish;

    EXPECT_EQ(parse_upload_response(nullptr, 0, &key), -1);
    EXPECT_EQ(key, nullptr);
}

} // namespace
} // namespace quillmere_test
