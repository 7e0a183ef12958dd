// A reply that ends anywhere, and one that is damaged anywhere.
#include <gtest/gtest.h>

#include <cstring>

#include "support/log_capture.h"
#include "xml/lookup.h"

namespace quillmere_test {
namespace {

const std::string sample = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                           "<response>\n"
                           "  <!-- a comment -->\n"
                           "  <action>user/get_info</action>\n"
                           "  <user_info id=\"1\"><name>J\xc3\xa9r&#244;me &amp; "
                           "<![CDATA[<co>]]></name><empty/></user_info>\n"
                           "  <result>Success</result>\n"
                           "</response>";

class TruncatedDocument : public testing::Test {
protected:
    // The memory ends where the document does, so that the sanitizer sees a step beyond.
    looked_up look_up_prefix(size_t length, const char *sought)
    {
        auto *cut = static_cast<char *>(std::malloc(length + 1));
        std::memcpy(cut, sample.data(), length);
        cut[length] = '\0';
        int32_t parse_failed = 77;
        char *value = simple_get_xml_node_value(cut, length, sought, &parse_failed);
        api_free(cut);
        return {taken(value), parse_failed};
    }

    // How much of a text at this place lies in the first bytes of the sample.
    static std::optional<std::string> part_of(const std::string &text, size_t length)
    {
        size_t start = sample.find(">" + text + "<") + 1;
        if (length <= start)
            return std::nullopt;
        return text.substr(0, length - start);
    }

    log_capture log;
};

TEST_F(TruncatedDocument, FailsAtEveryByteAndKeepsWhatItHas)
{
    for (size_t length = 1; length < sample.size(); ++length) {
        SCOPED_TRACE(sample.substr(0, length));
        looked_up found = look_up_prefix(length, "result");
        EXPECT_EQ(found.parse_failed, 1);
        EXPECT_EQ(found.value, part_of("Success", length));
    }
}

TEST_F(TruncatedDocument, FailsAtEveryByteOfAnyKindOfMarkup)
{
    for (size_t length = 1; length < sample.size(); ++length) {
        SCOPED_TRACE(sample.substr(0, length));
        looked_up found = look_up_prefix(length, "/user_info/name");
        EXPECT_EQ(found.parse_failed, 1);
        std::string whole = "J\xc3\xa9r\xc3\xb4me & <co>";
        std::string kept = found.value.value_or("");
        EXPECT_EQ(kept, whole.substr(0, kept.size()));
    }
}

TEST_F(TruncatedDocument, IsNoneWhenItIsWhole)
{
    looked_up found = look_up_prefix(sample.size(), "/user_info/name");

    EXPECT_EQ(found.parse_failed, 0);
    EXPECT_EQ(found.value, "J\xc3\xa9r\xc3\xb4me & <co>");
}

TEST_F(TruncatedDocument, GivesAnErrorAtEveryByte)
{
    const std::string refusal = "<response><error>105</error><message>No</message></response>";
    size_t digits = refusal.find("105");

    for (size_t length = 1; length < refusal.size(); ++length) {
        SCOPED_TRACE(refusal.substr(0, length));
        int32_t number = 77;
        char *message = nullptr;
        get_error_from_xml(refusal.data(), length, &number, &message);
        EXPECT_EQ(taken(message), "Error parsing XML when trying to get error text");
        std::string read =
            length > digits ? refusal.substr(digits, std::min<size_t>(length - digits, 3)) : "-9";
        EXPECT_EQ(number, std::stoi(read));
    }
}

TEST_F(TruncatedDocument, SurvivesEveryByteInEveryPlace)
{
    // Whether a damaged document is well-formed is the parser's business; the library must neither
    // crash nor read on.
    for (size_t place = 0; place < sample.size(); ++place)
        for (int byte : {0x00, 0x3c, 0x3e, 0x26, 0x80, 0xff}) {
            std::string damaged = sample;
            damaged[place] = static_cast<char>(byte);
            looked_up found = look_up(damaged, "name");
            EXPECT_TRUE(found.parse_failed == 0 || found.parse_failed == 1);
        }
}

} // namespace
} // namespace quillmere_test
