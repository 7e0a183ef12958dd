// The SHA-1 digest in hexadecimal, with vectors of FIPS 180.
#include <gtest/gtest.h>

#include <cstring>
#include <ostream>
#include <string>

#include "quillmere.h"

namespace quillmere_test {
namespace {

struct digest_case {
    std::string data;
    const char *digest;
};

std::ostream &operator<<(std::ostream &out, const digest_case &digest)
{
    return out << digest.data.size() << " bytes";
}

class Sha1 : public testing::TestWithParam<digest_case> {};

TEST_P(Sha1, IsWrittenAsFortyLowerCaseDigits)
{
    char digest[42];
    std::memset(digest, '#', sizeof digest);

    int32_t result = simple_sha1(GetParam().data.data(), GetParam().data.size(), digest, 41);

    EXPECT_EQ(result, 0);
    EXPECT_STREQ(digest, GetParam().digest);
    EXPECT_EQ(digest[41], '#');
}

INSTANTIATE_TEST_SUITE_P(
    Vectors, Sha1,
    testing::Values(digest_case{"", "da39a3ee5e6b4b0d3255bfef95601890afd80709"},
                    digest_case{"abc", "a9993e364706816aba3e25717850c26c9cd0d89d"},
                    digest_case{"abcdbcdecdefdefgefghfghighijhijkijkljklmklmnlmnomnopnopq",
                                "84983e441c3bd26ebaae4aa1f95129e5e54670f1"},
                    digest_case{std::string(1000000, 'a'),
                                "34aa973cd4c4daa4f61eeb2bdbad27316534016f"},
                    digest_case{std::string(1, '\0'), "5ba93c9db0cff93f52b521d7420e43f6eda2784f"}));

TEST(Sha1Digest, IsOfExactlyTheBytesNamed)
{
    char digest[41];

    simple_sha1("abcdef", 3, digest, sizeof digest);

    EXPECT_STREQ(digest, "a9993e364706816aba3e25717850c26c9cd0d89d");
}

TEST(Sha1Digest, OfNothingMayBeOfNull)
{
    char digest[41];

    EXPECT_EQ(simple_sha1(nullptr, 0, digest, sizeof digest), 0);
    EXPECT_STREQ(digest, "da39a3ee5e6b4b0d3255bfef95601890afd80709");
}

TEST(Sha1Digest, TakesMoreRoomThanItNeeds)
{
    char digest[100];

    EXPECT_EQ(simple_sha1("abc", 3, digest, sizeof digest), 0);
    EXPECT_STREQ(digest, "a9993e364706816aba3e25717850c26c9cd0d89d");
}

class TooLittleRoom : public testing::TestWithParam<uint64_t> {};

TEST_P(TooLittleRoom, IsRefusedAndNothingWritten)
{
    std::string output(41, '#');

    int32_t result = simple_sha1("abc", 3, output.data(), GetParam());

    EXPECT_EQ(result, 1);
    EXPECT_EQ(output, std::string(41, '#'));
}

INSTANTIATE_TEST_SUITE_P(Capacities, TooLittleRoom, testing::Values(0, 1, 39, 40));

} // namespace
} // namespace quillmere_test
