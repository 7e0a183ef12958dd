#include "header_values.h"

#include <gtest/gtest.h>

#include "digest.h"
#include "errors.h"

using namespace emulator;

namespace {

struct disposition {
    const char *field;
    const char *name;
};

class Dispositions : public testing::TestWithParam<disposition> {};

// Of the text "abc".
const std::string abc = "ungWv48Bz+pBQUDeXa4iI7ADYaOWF3qctBD/YfIAFa0=";
const std::string abc_hex = "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad";

} // namespace

TEST_P(Dispositions, NameTheFile) { EXPECT_EQ(file_name_in(GetParam().field), GetParam().name); }

INSTANTIATE_TEST_SUITE_P(
    HeaderValues, Dispositions,
    testing::Values(disposition{"attachment; filename=a.txt", "a.txt"},
                    disposition{"attachment;filename=\"a b.txt\"", "a b.txt"},
                    disposition{"attachment; FileName = \"a;b=c.txt\" ; x=y", "a;b=c.txt"},
                    disposition{"attachment; filename=\"a\\\"b\\\\c\"", "a\"b\\c"},
                    disposition{"attachment; filename*=UTF-8''%e2%82%AC%20a", "\xe2\x82\xac a"},
                    disposition{"attachment; filename*=utf-8'en'a'b", "a'b"},
                    disposition{"attachment; filename=\"plain\"; filename*=UTF-8''full", "full"},
                    disposition{"attachment; filename*=UTF-8''full; filename=plain", "full"},
                    disposition{"attachment; filename=\"\"", ""}));

TEST(HeaderValues, NameNoFileWithoutAParameterForIt)
{
    EXPECT_EQ(file_name_in(""), std::nullopt);
    EXPECT_EQ(file_name_in("attachment"), std::nullopt);
    EXPECT_EQ(file_name_in("attachment; size=3"), std::nullopt);
}

TEST(HeaderValues, RefuseADispositionThatIsDamaged)
{
    for (const char *field :
         {"attachment; filename", "attachment; =a", "attachment; filename=\"a",
          "attachment; filename=\"a\\", "attachment; filename=\"a\"b",
          "attachment; filename=a; filename=b", "attachment; filename*=a",
          "attachment; filename*=UTF-8'a", "attachment; filename*=UTF-8''%e",
          "attachment; filename*=ISO-8859-1''a", "attachment; filename=a; filename*=UTF-8''%zz"})
        EXPECT_THROW(file_name_in(field), refusal) << field;
}

TEST(HeaderValues, HoldTheDigest)
{
    const std::string item = "sha-256=:" + abc + ":";
    for (const std::string &field :
         {item, "sha-512=:AAAA:, " + item, item + ",unixsum=:AAAA:", " " + item + ";p=1 ",
          "sha-256=:" + std::string(43, 'A') + "=:, " + item})
        EXPECT_EQ(sha256_in("Content-Digest", field), abc_hex) << field;
}

TEST(HeaderValues, HoldNoDigestOfAnotherKind)
{
    EXPECT_EQ(sha256_in("Content-Digest", ""), std::nullopt);
    EXPECT_EQ(sha256_in("Content-Digest", "sha-512=:AAAA:"), std::nullopt);
}

TEST(HeaderValues, RefuseADigestThatIsDamaged)
{
    for (const std::string &value :
         {std::string(), std::string(":"), std::string("::"), ":" + abc, abc + ":", abc,
          ":" + abc.substr(4) + ":", ":AAAA" + abc + ":", ": " + abc.substr(1) + ":",
          ":" + abc.substr(0, 41) + "===:", ":" + abc.substr(0, 43) + "!:"})
        EXPECT_THROW(sha256_in("Content-Digest", "sha-256=" + value), refusal) << value;
}
