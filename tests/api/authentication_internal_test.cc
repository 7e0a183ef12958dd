// What the authentication operations do with memory that is not theirs, and without a signature.
#include <gtest/gtest.h>

#include <cstdlib>

#include "api/deliberate_leak.h"
#include "api/operations.h"
#include "interpose/heap.h"
#include "support/library_fixture.h"

// The linker leads the library's own calls of simple_sha1 here.
extern "C" {
int32_t real_sha1(const void *data, uint64_t length, char *output,
                  uint64_t output_capacity) __asm__("__real_simple_sha1");
int32_t failing_sha1(const void *data, uint64_t length, char *output,
                     uint64_t output_capacity) __asm__("__wrap_simple_sha1");
}

namespace {

bool sha1_fails = false;
uint64_t sha1_capacity = 0;

} // namespace

int32_t failing_sha1(const void *data, uint64_t length, char *output, uint64_t output_capacity)
{
    sha1_capacity = output_capacity;
    return sha1_fails ? 1 : real_sha1(data, length, output, output_capacity);
}

namespace quillmere_test {
namespace {

class Signature : public library_test {
protected:
    ~Signature() override { sha1_fails = false; }
};

TEST_F(Signature, HasRoomForFortyDigits)
{
    server.answer(xml_reply("<response><result>Error</result></response>"));
    char *token = nullptr;

    get_session_token("a", "b", nullptr, "c", "d", &token);

    EXPECT_EQ(sha1_capacity, 41u);
    api_free(token);
}

TEST_F(Signature, ThatCannotBeMadeEndsASessionTokensCallAtOnce)
{
    sha1_fails = true;
    hook_recorder hook;
    char rubbish[] = "rubbish";
    char *token = rubbish;
    int64_t held = blocks_held();

    EXPECT_EQ(get_session_token("a", "b", nullptr, "c", "d", &token), QM_SIGNATURE_FAILED);

    EXPECT_EQ(token, nullptr);
    EXPECT_EQ(server.connections(), 0u);
    EXPECT_EQ(log.text(), "");
    EXPECT_TRUE(hook.calls().empty());
    EXPECT_EQ(blocks_held(), held);
}

TEST_F(Signature, ThatCannotBeMadeEndsALoginTokensCallAtOnce)
{
    sha1_fails = true;
    char mine[] = "mine";
    char *pkey = mine;
    char rubbish[] = "rubbish";
    char *token = rubbish;

    EXPECT_EQ(get_login_token("a", "b", "c", "d", &pkey, &token), QM_SIGNATURE_FAILED);

    EXPECT_EQ(token, nullptr);
    EXPECT_EQ(pkey, mine);
    EXPECT_EQ(server.connections(), 0u);
    EXPECT_EQ(log.text(), "");
}

class PkeySlot : public library_test {
protected:
    // How many of the blocks that the caller had or was given, the slot included, are left.
    int64_t blocks_left_after(const std::string &reply)
    {
        server.answer(xml_reply(reply));
        int64_t held = blocks_held();
        pkey_slot pkey;
        char *token = nullptr;
        {
            deliberate_leak of_the_pkey;
            EXPECT_EQ(get_login_token("a", "b", "c", "d", pkey.place(), &token),
                      QM_MALFORMED_REPLY);
        }
        std::free(token);
        return blocks_held() - held;
    }
};

TEST_F(PkeySlot, IsFreedOnceWhenAReplyWithoutAPkeyIsMalformed)
{
    EXPECT_EQ(blocks_left_after("<response><result>Success</result>"), 0);
}

TEST_F(PkeySlot, IsFreedWithoutThePkeyThatItHeld)
{
    EXPECT_EQ(blocks_left_after("<response><pkey>the key</pkey><result>Success</result>"), 1);
}

TEST_F(PkeySlot, IsFreedAfterAMalformedRefusal)
{
    EXPECT_EQ(blocks_left_after("<response><result>Error</result>"), 0);
}

TEST_F(PkeySlot, IsFreedAfterAReplyThatIsNoXml) { EXPECT_EQ(blocks_left_after("not XML"), 0); }

TEST_F(PkeySlot, StaysTheCallersAfterEveryOtherReply)
{
    server.answer(xml_reply("<response><pkey>the key</pkey><result>Success</result></response>"));
    int64_t held = blocks_held();
    pkey_slot pkey;
    char *token = nullptr;

    EXPECT_EQ(get_login_token("a", "b", "c", "d", pkey.place(), &token), QM_UNUSABLE_RESPONSE);

    EXPECT_EQ(blocks_held() - held, 2);
    EXPECT_EQ(pkey.take(), "the key");
    EXPECT_EQ(blocks_held() - held, 0);
}

// Whatever the reply, an operation keeps nothing but what it hands out, which is taken here.
class OperationBlocks : public library_test,
                        public testing::WithParamInterface<std::tuple<operation, const char *>> {};

TEST_P(OperationBlocks, AreAllGivenBack)
{
    const auto &[what, reply] = GetParam();
    server.answer(xml_reply(reply[0] == '+' ? what.success() : reply));
    int64_t held = blocks_held();

    what.perform();

    EXPECT_EQ(blocks_held() - held, 0);
}

INSTANTIATE_TEST_SUITE_P(
    Replies, OperationBlocks,
    testing::Combine(testing::ValuesIn(operations),
                     testing::Values("+", "", "not XML", "<response/>",
                                     "<response><result>Success</result></response>",
                                     "<response><result>Success</result>",
                                     "<response><result>Error</result><error>105</error>"
                                     "<message>No</message></response>",
                                     "<response><result>Error</result><error>105</error>")));

} // namespace
} // namespace quillmere_test
