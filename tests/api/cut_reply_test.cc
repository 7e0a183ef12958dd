// Replies that are cut off, at every byte, for every operation on an account.
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "api/account_operations.h"
#include "support/library_fixture.h"

namespace quillmere_test {
namespace {

using optional_text = std::optional<std::string>;

constexpr const char *unread_error = "Error parsing XML when trying to get error text";

bool has_result(const std::string &part) { return part.find("<result>S") != std::string::npos; }

// A part of "Success" is another word, which means a refusal.
bool half_a_word(const std::string &part)
{
    return has_result(part) && part.find("Success") == std::string::npos;
}

class CutReply : public library_test, public testing::WithParamInterface<account_operation> {
protected:
    // Without TLS, since there are hundreds of exchanges, and with the log thrown away, since each
    // failed lookup writes the whole reply to it.
    CutReply() : nowhere_(std::fopen("/dev/null", "w"), std::fclose)
    {
        point_at(plain_server);
        set_output_file(nowhere_.get());
    }

    // What the message is, given how much of the result has arrived.
    optional_text message_after(const std::string &part) const
    {
        if (!has_result(part))
            return explained("Response error: received server HTTP response code 200");
        if (!half_a_word(part) || operation.errors == error_reading::direct)
            return std::nullopt;
        return unread_error;
    }
    optional_text explained(const char *message) const
    {
        return operation.explains_failures ? optional_text(message) : std::nullopt;
    }

    const account_operation &operation = GetParam();

private:
    std::unique_ptr<std::FILE, int (*)(std::FILE *)> nowhere_;
};

INSTANTIATE_TEST_SUITE_P(Api, CutReply, testing::ValuesIn(account_operations),
                         [](const auto &tested) { return std::string(tested.param.name); });

TEST_P(CutReply, IsMalformedWhereverItEnds)
{
    std::string whole = operation.accepted_reply();

    for (size_t length = 1; length < whole.size(); ++length) {
        std::string part = whole.substr(0, length);
        plain_server.answer(xml_reply(part));
        hook_recorder hook;

        call_outcome outcome = operation.call();

        EXPECT_EQ(outcome.status, QM_MALFORMED_REPLY) << part;
        EXPECT_EQ(outcome.message, message_after(part)) << part;
        EXPECT_EQ(hook.calls().size(), half_a_word(part) ? 1u : 0u) << part;
    }
}

TEST_P(CutReply, HandsOutNoTextsRecordsOrLists)
{
    std::string whole = operation.accepted_reply();
    const bool makes_lists = operation.path_variable == &get_device_changes_uri;

    for (size_t length = whole.find("Success"); length < whole.size(); ++length) {
        plain_server.answer(xml_reply(whole.substr(0, length)));

        std::string results = operation.call().results;

        EXPECT_EQ(results.find('{'), std::string::npos) << results;
        EXPECT_EQ(results.find("untouched"), std::string::npos) << results;
        bool made = makes_lists && length >= whole.find("</result>");
        EXPECT_EQ(results.find("changes=deleted") != std::string::npos, made) << results;
    }
}

// The numbers that were read before the damage stay, where the operation says so.
TEST_P(CutReply, KeepsNothingButNumbersAtTheLastByte)
{
    std::string whole = operation.accepted_reply();
    plain_server.answer(xml_reply(whole.substr(0, whole.size() - 1)));
    std::string name = operation.name;

    std::string results = operation.call().results;

    if (name == "get_folder_content")
        EXPECT_EQ(results, "folders=1 files=1 chunk=7 folders=NULL files=NULL");
    else if (name == "get_links")
        EXPECT_EQ(results, "count=1 links=NULL");
    else if (name == "get_download_link")
        EXPECT_EQ(results, "url=NULL bandwidth=9 error=3 text=NULL");
    else if (name == "get_device_changes")
        EXPECT_EQ(results, "revision=59 count=1 block=500 changes=deleted");
    else
        EXPECT_EQ(results, operation.nothing);
}

} // namespace
} // namespace quillmere_test
