// The masking log stream: what passes through it, and that no secret of a session does.
#include <gtest/gtest.h>

#include <cstdio>
#include <memory>
#include <string>
#include <string_view>

#include "support/library_fixture.h"

extern "C" {
#include "masking_log.h"
}

namespace quillmere_test {
namespace {

// A masking log that writes into memory.
class masked_log {
public:
    masked_log() : memory_(open_memstream(&bytes_, &length_)), stream_(masking_log_new(memory_)) {}
    ~masked_log()
    {
        std::fclose(stream_);
        std::fclose(memory_);
        std::free(bytes_);
    }
    masked_log(const masked_log &) = delete;
    masked_log &operator=(const masked_log &) = delete;

    std::FILE *stream() const { return stream_; }

    void write(std::string_view piece)
    {
        std::fwrite(piece.data(), 1, piece.size(), stream_);
        std::fflush(stream_);
    }

    std::string text() const { return {bytes_, length_}; }

private:
    char *bytes_ = nullptr;
    size_t length_ = 0;
    std::FILE *memory_;
    std::FILE *stream_;
};

struct masking_case {
    const char *text;
    const char *passed;
};

class MaskingLog : public testing::TestWithParam<masking_case> {};

constexpr masking_case cases[] = {
    {"", ""},
    {"Got text:\n<a>b</a>\n", "Got text:\n<a>b</a>\n"},
    {"https://h/p?session_token=abc&version=2\n", "https://h/p?session_token=(masked)&version=2\n"},
    {"?email=a%40b&password=p%20w!&x=1", "?email=a%40b&password=(masked)&x=1"},
    {"?password=&x=1", "?password=&x=1"},
    {"?Session_Token=abc\nsignature=00\n", "?Session_Token=(masked)\nsignature=(masked)\n"},
    {"quick_key=abc&tokens=3", "quick_key=abc&tokens=3"},
    {"the session_token is gone", "the session_token is gone"},
    {"<a password=\"x y&z\">b</a>\nc", "<a password=(masked)\nc"},
    {"password='x password='y'\nc", "password=(masked)\nc"},
    {"<pkey>abc</pkey><x>1</x>", "<pkey>(masked)</pkey><x>1</x>"},
    {"<pkey a=\"b\">c</pkey>d", "<pkey >(masked)</pkey>d"},
    {"<pkey/><x>1</x>", "<pkey/><x>1</x>"},
    {"<pkey /><x>1</x>", "<pkey /><x>1</x>"},
    {"<pkey>a<b>c</b><</pkex></pkey>d", "<pkey>(masked)</pkey>d"},
    {"<session_token>abc\nGot text:\n", "<session_token>(masked)"},
    {"xxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxx_token=a b",
     "xxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxx_token=(masked) b"},
};

TEST_P(MaskingLog, HidesSecretsAndNothingElse)
{
    masked_log log;

    log.write(GetParam().text);

    EXPECT_EQ(log.text(), GetParam().passed);
}

TEST_P(MaskingLog, DoesSoInPiecesOfEverySize)
{
    const std::string_view text = GetParam().text;
    for (size_t size = 1; size < text.size(); ++size) {
        masked_log log;

        for (size_t at = 0; at < text.size(); at += size)
            log.write(text.substr(at, size));

        EXPECT_EQ(log.text(), GetParam().passed) << "in pieces of " << size;
    }
}

INSTANTIATE_TEST_SUITE_P(Cases, MaskingLog, testing::ValuesIn(cases));

class MaskedSession : public library_test {
protected:
    MaskedSession() { set_output_file(masked.stream()); }
    ~MaskedSession() override { set_output_file(log_of_the_fixture); }

    static std::string reply_of(const std::string &elements)
    {
        return "<response>" + elements + "</response>";
    }

    void expect_no_canary() const
    {
        const std::string text = masked.text();
        EXPECT_EQ(text.find("canary"), std::string::npos) << text;
        EXPECT_NE(text.find("(masked)"), std::string::npos) << text;
    }

    std::FILE *const log_of_the_fixture = output_file;
    masked_log masked;
};

} // namespace

TEST_F(MaskedSession, ShowsNoSecretOfALogin)
{
    server.answer(
        xml_reply(reply_of("<result>Success</result><session_token>canary-1</session_token>"
                           "<pkey>canary-2</pkey>")));
    char *token = nullptr;

    EXPECT_EQ(get_session_token("a@b.c", "canary-3", nullptr, "42", "canary-4", &token), QM_OK);

    api_free(token);
    expect_no_canary();
}

TEST_F(MaskedSession, ShowsNoTokenOfAnOperation)
{
    server.answer(xml_reply(reply_of("<result>Success</result>")));
    uint64_t revision = 0;
    int32_t busy = 0;
    char *message = nullptr;

    get_device_status("canary-1", 0, &revision, &busy, &message);

    api_free(message);
    expect_no_canary();
}

TEST_F(MaskedSession, ShowsNoTokenOfAReplyThatIsCutOff)
{
    server.answer(xml_reply("<response><result>Success</result><session_token>canary-1"));
    char *token = nullptr;

    EXPECT_LT(renew_session_token("canary-2", &token), 0);

    api_free(token);
    expect_no_canary();
}

} // namespace quillmere_test
