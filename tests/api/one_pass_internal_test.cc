// Every operation reads a whole reply in one pass, and makes of any reply what it makes of it when
// that pass fails.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <random>
#include <sstream>

#include <expat.h>

#include "api/account_operations.h"
#include "api/deliberate_leak.h"
#include "api/sample_calls.h"
#include "support/hook_recorder.h"
#include "support/log_capture.h"

// The linker leads the library's own calls here.
extern "C" {
XML_Status real_parse(XML_Parser parser, const char *xml, int length,
                      int final) __asm__("__real_XML_Parse");
XML_Status counted_parse(XML_Parser parser, const char *xml, int length,
                         int final) __asm__("__wrap_XML_Parse");
int64_t given_response(const char *url, const void *body, uint64_t body_length, char **response,
                       uint64_t *response_length,
                       int64_t timeout) __asm__("__wrap_get_response_from_url");
}

namespace {

size_t passes = 0;
bool first_pass_fails = false;
std::string reply;

} // namespace

XML_Status counted_parse(XML_Parser parser, const char *xml, int length, int final)
{
    ++passes;
    if (passes == 1 && first_pass_fails)
        return XML_STATUS_ERROR;
    return real_parse(parser, xml, length, final);
}

int64_t given_response(const char *, const void *, uint64_t, char **response,
                       uint64_t *response_length, int64_t)
{
    *response_length = reply.size();
    *response = static_cast<char *>(std::malloc(reply.size() + 1));
    std::memcpy(*response, reply.c_str(), reply.size() + 1);
    return 200;
}

namespace quillmere_test {
namespace {

// One operation with all that comes out of it, and a reply that it accepts.
struct reading_operation {
    const char *name;
    call_outcome (*call)();
    std::string accepted;
};

call_outcome whole_login_token_call()
{
    deliberate_leak of_the_slot_of_a_malformed_reply;
    pkey_slot pkey;
    return login_token_call(pkey);
}

std::vector<reading_operation> reading_operations()
{
    const operation &login = operations[4];
    std::vector<reading_operation> all = {{login.name, whole_login_token_call, login.success()}};
    for (const sample_call &each : sample_calls)
        all.push_back({each.of.name, each.call, each.of.success()});
    for (const account_operation &each : account_operations)
        all.push_back({each.name, each.call, each.accepted_reply()});
    return all;
}

class OnePassOperation : public testing::TestWithParam<reading_operation> {
protected:
    OnePassOperation() { first_pass_fails = false; }
    ~OnePassOperation() override { first_pass_fails = false; }

    // What the caller, the hook and the reader of the log see of a call.
    static std::string seen(const std::string &given, bool pass_fails)
    {
        reply = given;
        passes = 0;
        first_pass_fails = pass_fails;
        hook_recorder hook;
        log_capture log;
        std::ostringstream words;
        words << GetParam().call();
        for (const auto &call : hook.calls())
            words << "\nhook: " << call.url.value_or("NULL") << call.response.value_or("NULL")
                  << call.status << call.message.value_or("NULL");
        return words.str() + "\n" + log.text();
    }

    static void expect_same(const std::string &given)
    {
        std::string in_one_pass = seen(given, false);
        EXPECT_EQ(in_one_pass, seen(given, true)) << given;
    }

    const std::string refusing =
        refusing_reply("<error>105</error><message>No</message><pkey>p</pkey>");
};

INSTANTIATE_TEST_SUITE_P(All, OnePassOperation, testing::ValuesIn(reading_operations()),
                         [](const auto &tested) { return std::string(tested.param.name); });

TEST_P(OnePassOperation, ReadsAnAcceptingReplyOnce)
{
    seen(GetParam().accepted, false);

    EXPECT_EQ(passes, 1u);
}

TEST_P(OnePassOperation, ReadsARefusingReplyOnce)
{
    seen(refusing, false);

    EXPECT_EQ(passes, 1u);
}

TEST_P(OnePassOperation, ReadsAReplyWithoutAResultOnce)
{
    seen("<response/>", false);

    EXPECT_EQ(passes, 1u);
}

TEST_P(OnePassOperation, GivesTheSameWhenThatPassFails)
{
    expect_same(GetParam().accepted);
    expect_same(refusing);
    expect_same(refusing_reply(""));
    expect_same(refusing_reply("<error>0</error><x><error>3</error><message>m</message></x>"));
    expect_same("<response/>");
    expect_same("");
}

TEST_P(OnePassOperation, GivesTheSameWhereverAReplyIsCutOff)
{
    for (const std::string &whole : {GetParam().accepted, refusing})
        for (size_t length = 1; length < whole.size(); ++length)
            expect_same(whole.substr(0, length));
}

// The same bytes in every run. Some replies stay well-formed, most do not.
TEST_P(OnePassOperation, GivesTheSameWhateverBytesAreChanged)
{
    constexpr const char bytes[] = "<>/&; aEr\0\n0";
    std::mt19937 random(20261121);
    for (int round = 0; round < 300; ++round) {
        std::string changed = GetParam().accepted;
        changed[random() % changed.size()] = bytes[random() % (sizeof bytes - 1)];
        expect_same(changed);
    }
}

class OnePassLookup : public testing::Test {
protected:
    OnePassLookup() { first_pass_fails = false; }

    log_capture log;
};

// The details of linked accounts are in the same pass, and yet do not count without the link.
TEST_F(OnePassLookup, ReadsAUserWithLinkedAccountsOnce)
{
    const std::string user = "<user_info><facebook><linked>yes</linked><name>f</name></facebook>"
                             "<twitter><linked>no</linked><name>t</name></twitter></user_info>";
    reply = accepted_reply(user);
    passes = 0;

    call_outcome outcome = user_info_call("token");

    EXPECT_EQ(outcome.results, "record{fb_name=f fb_linked=yes tw_linked=no}");
    EXPECT_EQ(passes, 1u);
}

TEST_F(OnePassLookup, ReadsTheSampleOfTheFeedOnce)
{
    passes = 0;

    EXPECT_EQ(sample_changes_call("token", 1, 2).status, QM_OK);

    EXPECT_EQ(passes, 1u);
}

// An event handler or a hook may well ask something of the service.
int32_t ask_again(const char *, const char *, int32_t, const char *)
{
    reply = accepted_reply("<storage_used>5</storage_used>");
    EXPECT_EQ(user_limits_call("token").results, "record{storage_used=5}");
    return 0;
}

TEST_F(OnePassLookup, MayBeginWithinTheHookOfAnotherOperation)
{
    auto before = check_api_error;
    check_api_error = ask_again;
    reply = refusing_reply("<error>105</error><message>No</message>");

    call_outcome outcome = user_info_call("token");

    EXPECT_EQ(outcome.status, 105);
    EXPECT_EQ(outcome.message, "No");
    check_api_error = before;
}

} // namespace
} // namespace quillmere_test
