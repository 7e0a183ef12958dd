// What of the library's log may be seen, however the log is cut into pieces.
#include "masking_filter.h"

#include <string>
#include <string_view>

#include <gtest/gtest.h>

namespace quillmere_test {
namespace {

using quillmere::tools::is_secret_name;
using quillmere::tools::masking_filter;

std::string masked(std::string_view text)
{
    masking_filter filter;
    std::string passed;
    filter.feed(text, passed);
    return passed;
}

struct masking_case {
    const char *name;
    const char *text;
    const char *passed;
};

class MaskingFilter : public testing::TestWithParam<masking_case> {};

TEST_P(MaskingFilter, HidesSecretsAndNothingElse)
{
    EXPECT_EQ(masked(GetParam().text), GetParam().passed);
}

TEST_P(MaskingFilter, DoesSoWhereverItsInputIsCut)
{
    const std::string_view text = GetParam().text;

    for (size_t first = 0; first <= text.size(); ++first) {
        for (size_t second = first; second <= text.size(); ++second) {
            masking_filter filter;
            std::string passed;
            filter.feed(text.substr(0, first), passed);
            filter.feed(text.substr(first, second - first), passed);
            filter.feed(text.substr(second), passed);
            ASSERT_EQ(passed, GetParam().passed) << "cut at " << first << " and " << second;
        }
    }
}

constexpr masking_case cases[] = {
    {"Nothing", "", ""},
    {"PlainText", "Got text:\n<a>b</a>\n", "Got text:\n<a>b</a>\n"},
    {"TokenInAQuery", "url: https://h/p?session_token=abc123&version=2\n",
     "url: https://h/p?session_token=(masked)&version=2\n"},
    {"SecretAtTheEndOfALine", "x?signature=00ff\nnext", "x?signature=(masked)\nnext"},
    {"SecretAtTheEndOfTheLog", "x?password=p%20w", "x?password=(masked)"},
    {"CharactersThatTheLibraryLeavesAsTheyAre", "?password=a!(b)*^c&d=e", "?password=(masked)&d=e"},
    {"EmptyValue", "?password=&email=a", "?password=&email=a"},
    {"UpperCase", "?Session_Token=abc&x=1", "?Session_Token=(masked)&x=1"},
    {"SeveralSecrets", "?fb_access_token=a&signature=b",
     "?fb_access_token=(masked)&signature=(masked)"},
    {"TwoInARow", "pkey=1 pkey=2", "pkey=(masked) pkey=(masked)"},
    {"OtherKeys", "?quickkey=abc&folder_key=def&email=a%40b",
     "?quickkey=abc&folder_key=def&email=a%40b"},
    {"NameWithoutAValue", "the session_token is gone", "the session_token is gone"},
    {"Element", "<r><session_token>abc</session_token><x>1</x></r>",
     "<r><session_token>(masked)</session_token><x>1</x></r>"},
    {"ElementWithBlanksInItsTag", "<pkey  >abc</pkey><x/>", "<pkey >(masked)</pkey><x/>"},
    {"ElementWithAttributes", "<pkey a=\"b\">abc</pkey>", "<pkey >(masked)</pkey>"},
    {"EmptyElement", "<pkey/><x>1</x>", "<pkey/><x>1</x>"},
    {"EmptyElementWithABlank", "<pkey /><x>1</x>",
     "<pkey />"
     "<x>1</x>"},
    {"ElementWithAChild", "<pkey>a<b>c</b>d</pkey>e", "<pkey>(masked)</pkey>e"},
    {"ElementWithCharacterData", "<pkey><![CDATA[a</b>c]]></pkey>d", "<pkey>(masked)</pkey>d"},
    {"ElementWithANearMiss", "<pkey>a<</pkeX></</pkey>d", "<pkey>(masked)</pkey>d"},
    {"ElementThatIsCutOff", "<login_token>abc\nGot text:\n<a>", "<login_token>(masked)"},
    {"ElementThatIsRepeated", "<pkey>a</pkey><pkey>b</pkey>",
     "<pkey>(masked)</pkey><pkey>(masked)</pkey>"},
    {"ElementsOfManyNames",
     "<secret_key>a</secret_key><password>b</password><login_token>c</login_token>",
     "<secret_key>(masked)</secret_key><password>(masked)</password>"
     "<login_token>(masked)</login_token>"},
    {"OrdinaryElements", "<quickkey>abc</quickkey>", "<quickkey>abc</quickkey>"},
    {"QuotedValue", "<a password=\"x y&z\">b</a>", "<a password=\"(masked)\">b</a>"},
    {"QuotedBySingleMarks", "password='x\"y' z", "password='(masked)' z"},
    {"QuotedValueThatIsCutOff", "password=\"ab password=\"cd\" e", "password=\"(masked)\" e"},
    {"QuotedValueThatIsCutOffAheadOfATag", "password=\"ab <pkey c=\"d\">e</pkey> f",
     "password=\"(masked)>(masked)</pkey> f"},
    {"QuotedValueThatEndsLikeAName", "password=\"token\" a=\"b\"", "password=\"(masked)\" a=\"b\""},
    {"LinkInAPage", "<a href=\"/p?session_token=abc&amp;x=1\">",
     "<a href=\"/p?session_token=(masked)&amp;x=1\">"},
};

INSTANTIATE_TEST_SUITE_P(Cases, MaskingFilter, testing::ValuesIn(cases),
                         [](const auto &tested) { return std::string(tested.param.name); });

TEST(MaskingFilterNames, AreFoundBehindAnEndlessRunOfLetters)
{
    const std::string run(1000, 'x');

    EXPECT_EQ(masked(run + "_token=abc&d"), run + "_token=(masked)&d");
}

TEST(MaskingFilterNames, IncludeEveryKindOfSecret)
{
    for (const char *name : {"session_token", "password", "signature", "fb_access_token",
                             "login_token", "application_key", "pkey", "secret_key", "PASSWORD"})
        EXPECT_TRUE(is_secret_name(name)) << name;
    for (const char *name : {"", "quickkey", "folder_key", "email", "device_id", "tokens", "key"})
        EXPECT_FALSE(is_secret_name(name)) << name;
}

} // namespace
} // namespace quillmere_test
