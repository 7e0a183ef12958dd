// Every operation with a reply that ends at every byte.
#include "api/operations.h"
#include "support/library_fixture.h"

namespace quillmere_test {
namespace {

class TruncatedReply : public library_test, public testing::WithParamInterface<operation> {
protected:
    // Without TLS, which makes hundreds of exchanges no slower than they need be.
    TruncatedReply() { point_at(plain_server); }

    performed perform_with(const std::string &reply)
    {
        plain_server.answer(xml_reply(reply));
        return GetParam().perform();
    }

    // What the exchange itself amounts to, if nothing but its code is known.
    std::optional<std::string> unusable() const
    {
        if (!GetParam().explains_failed_exchange)
            return std::nullopt;
        return "Response error: received server HTTP response code 200";
    }

    hook_recorder hook;
};

INSTANTIATE_TEST_SUITE_P(All, TruncatedReply, testing::ValuesIn(operations));

TEST_P(TruncatedReply, WithoutAByteIsUnusable)
{
    performed result = perform_with("");

    EXPECT_EQ(result.status, QM_UNUSABLE_RESPONSE);
    EXPECT_EQ(result.message, unusable());
}

TEST_P(TruncatedReply, IsMalformedAtEveryByteOfASuccess)
{
    const std::string whole = GetParam().success();
    const size_t result_text = whole.find("Success");
    const size_t result_end = result_text + std::string("Success").size();
    size_t hook_calls = 0;

    for (size_t length = 1; length < whole.size(); ++length) {
        SCOPED_TRACE(whole.substr(0, length));
        performed result = perform_with(whole.substr(0, length));
        EXPECT_EQ(result.status, QM_MALFORMED_REPLY);
        if (length <= result_text) {
            EXPECT_EQ(result.message, unusable());
        } else if (length < result_end) {
            // Half a "Success" is none, and so the reply is a refusal.
            EXPECT_EQ(result.message, "Error parsing XML when trying to get error text");
            ++hook_calls;
        }
        EXPECT_EQ(hook.calls().size(), hook_calls);
    }
}

TEST_P(TruncatedReply, IsMalformedAtEveryByteOfARefusal)
{
    const std::string whole =
        "<response><result>Error</result><error>105</error><message>No</message></response>";

    for (size_t length = 1; length < whole.size(); ++length) {
        SCOPED_TRACE(whole.substr(0, length));
        EXPECT_EQ(perform_with(whole.substr(0, length)).status, QM_MALFORMED_REPLY);
    }
    EXPECT_EQ(perform_with(whole).status, 105);
}

} // namespace
} // namespace quillmere_test
