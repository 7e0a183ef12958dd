// The error number and message of a refusal.
#include <gtest/gtest.h>

#include "support/log_capture.h"
#include "xml/lookup.h"

namespace quillmere_test {
namespace {

constexpr const char *parse_failure = "Error parsing XML when trying to get error text";

struct refusal {
    const char *what;
    const char *xml;
    int32_t number;
    std::optional<std::string> message;
};

void PrintTo(const refusal &each, std::ostream *out) { *out << each.what; }

class ApiError : public testing::TestWithParam<refusal> {
protected:
    std::string xml = GetParam().xml;
    log_capture log;
};

TEST_P(ApiError, HasANumberAndAMessage)
{
    char rubbish[] = "rubbish";
    char *message = rubbish;
    int32_t number = 77;

    get_error_from_xml(xml.data(), xml.size(), &number, &message);

    EXPECT_EQ(number, GetParam().number);
    EXPECT_EQ(taken(message), GetParam().message);
}

TEST_P(ApiError, IsReadWithoutItsMessage)
{
    int32_t number = 77;

    get_error_from_xml(xml.data(), xml.size(), &number, nullptr);

    EXPECT_EQ(number, GetParam().number);
}

TEST_P(ApiError, IsReadWithoutItsNumber)
{
    char *message = nullptr;

    get_error_from_xml(xml.data(), xml.size(), nullptr, &message);

    EXPECT_EQ(taken(message), GetParam().message);
}

TEST_P(ApiError, MayBeOfNoInterestAtAll)
{
    get_error_from_xml(xml.data(), xml.size(), nullptr, nullptr);
}

#define REFUSAL(inside) "<response><result>Error</result>" inside "</response>"

INSTANTIATE_TEST_SUITE_P(
    Replies, ApiError,
    testing::Values(
        refusal{"a number and a message", REFUSAL("<message>No</message><error>105</error>"), 105,
                "No"},
        refusal{"a number alone", REFUSAL("<error>105</error>"), 105, std::nullopt},
        refusal{"an empty message", REFUSAL("<error>105</error><message/>"), 105, std::nullopt},
        refusal{"a message alone", REFUSAL("<message>No</message>"), -8, "No"},
        refusal{"nothing", REFUSAL(""), -8, std::nullopt},
        refusal{"an empty number", REFUSAL("<error/><message>No</message>"), -8, "No"},
        refusal{"letters for a number", REFUSAL("<error>abc</error><message>No</message>"), -8,
                "No"},
        refusal{"the number 0", REFUSAL("<error>0</error><message>No</message>"), -8, "No"},
        refusal{"a number with letters", REFUSAL("<error> 12abc</error>"), 12, std::nullopt},
        refusal{"a negative number", REFUSAL("<error>-5</error>"), -5, std::nullopt},
        refusal{"the largest number", REFUSAL("<error>2147483647</error>"), 2147483647,
                std::nullopt},
        refusal{"numbers elsewhere do not count",
                REFUSAL("<file><error>1</error><message>no</message></file>"
                        "<error>105</error><message>No</message>"),
                105, "No"},
        refusal{"only numbers elsewhere",
                REFUSAL("<file><error>1</error><message>no</message></file>"), -8, std::nullopt},
        refusal{"two numbers are joined", REFUSAL("<error>10</error><error>5</error>"), 105,
                std::nullopt}));

INSTANTIATE_TEST_SUITE_P(
    Malformed, ApiError,
    testing::Values(
        refusal{"no XML", "this is not XML", -9, parse_failure},
        refusal{"cut off before the number", "<response><result>Error</result>", -9, parse_failure},
        refusal{"cut off behind the number", "<response><message>No</message><error>105</error>",
                105, parse_failure},
        refusal{"cut off behind the number 0", "<response><error>0</error>", -8, parse_failure}));

TEST(ApiErrorOfNothing, IsAnUnusableNumberWithoutAMessage)
{
    int32_t number = 77;
    char rubbish[] = "rubbish";
    char *message = rubbish;

    get_error_from_xml(nullptr, 0, &number, &message);

    EXPECT_EQ(number, -8);
    EXPECT_EQ(message, nullptr);
}

TEST(ApiErrorOfAMalformedReply, IsLoggedOnce)
{
    log_capture log;
    int32_t number = 0;
    char *message = nullptr;

    get_error_from_xml("not XML", 7, &number, &message);

    EXPECT_EQ(taken(message), parse_failure);
    EXPECT_EQ(log.text(), "Expat failed parsing a node with error 0\n"
                          "Name of node whose value is sought: /error\n"
                          "XML we are searching for this node:\nnot XML\n");
}

TEST(ApiErrorHook, IsNotCalledHere)
{
    static int calls = 0;
    api_error_hook before = check_api_error;
    check_api_error = [](const char *, const char *, int32_t, const char *) {
        ++calls;
        return int32_t{0};
    };
    int32_t number = 0;
    const std::string xml = REFUSAL("<error>105</error>");

    get_error_from_xml(xml.data(), xml.size(), &number, nullptr);

    check_api_error = before;
    EXPECT_EQ(number, 105);
    EXPECT_EQ(calls, 0);
}

} // namespace
} // namespace quillmere_test
