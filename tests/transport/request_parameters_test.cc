// How a request's URL starts, and what each adding function puts behind it.
#include <gtest/gtest.h>

#include <climits>

#include "support/globals_guard.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

constexpr const char *update_path = "/api/file/update.php";

TEST(RequestUrl, StartsOnTheEncryptedBaseAddress)
{
    globals_guard globals;
    urls[0] = "http://plain.example";
    urls[1] = "https://encrypted.example";

    owned_buffer url(api_url_new_https(update_path));

    EXPECT_EQ(text_of(url), "https://encrypted.example/api/file/update.php?");
    EXPECT_TRUE(ranges_of(url).empty());
}

TEST(RequestUrl, StartsOnThePlainBaseAddress)
{
    globals_guard globals;
    urls[0] = "http://plain.example";
    urls[1] = "https://encrypted.example";

    owned_buffer url(api_url_new_http(update_path));

    EXPECT_EQ(text_of(url), "http://plain.example/api/file/update.php?");
    EXPECT_TRUE(ranges_of(url).empty());
}

TEST(RequestUrl, HasRoomFor256Bytes)
{
    EXPECT_EQ(owned_buffer(api_url_new_https("/"))->capacity, 256u);
    EXPECT_EQ(owned_buffer(api_url_new_http("/"))->capacity, 256u);
}

TEST(RequestUrl, GrowsBeyondItsFirstRoom)
{
    globals_guard globals;
    urls[1] = "https://encrypted.example";
    const std::string path = "/" + std::string(300, 'p');

    owned_buffer url(api_url_new_https(path.c_str()));

    EXPECT_EQ(text_of(url), "https://encrypted.example" + path + "?");
}

TEST(RequestUrl, HasASeparatorBeforeTheFirstParameterToo)
{
    globals_guard globals;
    urls[1] = "https://encrypted.example";
    owned_buffer url(api_url_new_https(update_path));

    int64_t length = url_add_required_parameter(url.get(), "quick_key", "abc");
    url_add_required_parameter(url.get(), "k", "v");

    EXPECT_EQ(text_of(url), "https://encrypted.example/api/file/update.php?&quick_key=abc&k=v");
    EXPECT_EQ(length, 60);
}

using add_text = int64_t (*)(string_buffer *url, const char *key, const char *value);
using add_number = int64_t (*)(string_buffer *url, const char *key, int64_t value);

enum class skips { nothing, null, null_or_empty };

struct text_function {
    const char *name;
    add_text add;
    skips rule;
    bool sensitive;
};

void PrintTo(const text_function &each, std::ostream *out) { *out << each.name; }

const text_function text_functions[] = {
    {"url_add_required_parameter", url_add_required_parameter, skips::nothing, false},
    {"url_add_required_sensitive_parameter", url_add_required_sensitive_parameter, skips::nothing,
     true},
    {"url_add_optional_parameter_null", url_add_optional_parameter_null, skips::null, false},
    {"url_add_optional_parameter_null_or_empty", url_add_optional_parameter_null_or_empty,
     skips::null_or_empty, false},
    {"url_add_optional_sensitive_parameter_null", url_add_optional_sensitive_parameter_null,
     skips::null, true},
    {"url_add_optional_sensitive_parameter_null_or_empty",
     url_add_optional_sensitive_parameter_null_or_empty, skips::null_or_empty, true},
    {"url_add_string_parameter_", url_add_string_parameter_, skips::nothing, false},
    {"url_add_sensitive_string_parameter_", url_add_sensitive_string_parameter_, skips::nothing,
     true},
};

class TextParameter : public testing::TestWithParam<text_function> {
protected:
    int64_t add(const char *key, const char *value)
    {
        return GetParam().add(url.get(), key, value);
    }

    // The view that is logged.
    std::string shown() const { return string_get_obfs(url.get(), nullptr); }

    std::string if_sensitive(const char *marked, const char *open) const
    {
        return GetParam().sensitive ? marked : open;
    }

    owned_buffer url = buffer_of("u?");
};

INSTANTIATE_TEST_SUITE_P(All, TextParameter, testing::ValuesIn(text_functions));

TEST_P(TextParameter, IsAppendedEncodedWithItsNewLength)
{
    int64_t length = add("key", "a b");

    EXPECT_EQ(text_of(url), "u?&key=a%20b");
    EXPECT_EQ(length, 12);
}

TEST_P(TextParameter, IsShownOnlyIfItIsNotSensitive)
{
    add("key", "a b");

    EXPECT_EQ(shown(), if_sensitive("u?&key=(omitted)", "u?&key=a%20b"));
}

TEST_P(TextParameter, IsMarkedWithoutItsKey)
{
    add("key", "a b");

    std::vector<range> marked;
    if (GetParam().sensitive)
        marked = {{7, 12}};
    EXPECT_EQ(ranges_of(url), marked);
}

TEST_P(TextParameter, HasEveryByteOfItsValueEncodedByTheRule)
{
    add("key", "a-b_c.d~e(x)*!^\xc3\xa9&=%+/");

    EXPECT_EQ(text_of(url), "u?&key=a%2db%5fc%2ed%7ee(x)*!^%c3%a9%26%3d%25%2b%2f");
}

TEST_P(TextParameter, HasItsKeyAsItIs)
{
    add("a key&%=\xc3", "v");

    EXPECT_EQ(text_of(url), "u?&a key&%=\xc3=v");
}

TEST_P(TextParameter, MayBeAddedAgainAndAgain)
{
    add("k", "1");
    int64_t length = add("k", "2");

    EXPECT_EQ(text_of(url), "u?&k=1&k=2");
    EXPECT_EQ(length, 10);
    EXPECT_EQ(shown(), if_sensitive("u?&k=(omitted)&k=(omitted)", "u?&k=1&k=2"));
}

TEST_P(TextParameter, WithoutTextIsSkippedOrSentByItsRule)
{
    int64_t length = add("key", "");

    bool skipped = GetParam().rule == skips::null_or_empty;
    EXPECT_EQ(text_of(url), skipped ? "u?" : "u?&key=");
    EXPECT_EQ(length, skipped ? 2 : 7);
    EXPECT_EQ(shown(), text_of(url));
}

// A required one fails half-way, deliberately: its key stays.
TEST_P(TextParameter, OfNullIsSkippedOrLeavesItsKeyByItsRule)
{
    int64_t length = add("key", nullptr);

    bool required = GetParam().rule == skips::nothing;
    EXPECT_EQ(text_of(url), required ? "u?&key=" : "u?");
    EXPECT_EQ(length, required ? -1 : 2);
    EXPECT_EQ(shown(), text_of(url));
}

TEST_P(TextParameter, OfNullHidesAndShowsNothingElse)
{
    add("key", nullptr);
    url_add_required_parameter(url.get(), "open", "seen");
    url_add_required_sensitive_parameter(url.get(), "secret", "hidden");

    bool required = GetParam().rule == skips::nothing;
    EXPECT_EQ(shown(),
              std::string("u?") + (required ? "&key=" : "") + "&open=seen&secret=(omitted)");
}

TEST_P(TextParameter, StartsABufferThatHoldsNothing)
{
    url = new_buffer();

    EXPECT_EQ(add("k", "v"), 4);
    EXPECT_EQ(text_of(url), "&k=v");
}

struct number_case {
    add_number add;
    int64_t value;
    const char *expected; // the whole text
};

void PrintTo(const number_case &each, std::ostream *out) { *out << each.value << each.expected; }

class NumberParameter : public testing::TestWithParam<number_case> {};

TEST_P(NumberParameter, IsAddedInDecimalOrSkippedByItsRule)
{
    owned_buffer url = buffer_of("u?");

    int64_t length = GetParam().add(url.get(), "key", GetParam().value);

    EXPECT_EQ(text_of(url), GetParam().expected);
    EXPECT_EQ(length, static_cast<int64_t>(text_of(url).size()));
    EXPECT_TRUE(ranges_of(url).empty());
}

// Written without a sign, deliberately.
const number_case required_numbers[] = {
    {url_add_required_num_parameter, 0, "u?&key=0"},
    {url_add_required_num_parameter, 4096, "u?&key=4096"},
    {url_add_required_num_parameter, INT64_MAX, "u?&key=9223372036854775807"},
    {url_add_required_num_parameter, -1, "u?&key=18446744073709551615"},
    {url_add_required_num_parameter, INT64_MIN, "u?&key=9223372036854775808"},
    {url_add_num_parameter_, 0, "u?&key=0"},
    {url_add_num_parameter_, 4096, "u?&key=4096"},
    {url_add_num_parameter_, INT64_MAX, "u?&key=9223372036854775807"},
    {url_add_num_parameter_, -1, "u?&key=18446744073709551615"},
    {url_add_num_parameter_, INT64_MIN, "u?&key=9223372036854775808"},
};
INSTANTIATE_TEST_SUITE_P(Required, NumberParameter, testing::ValuesIn(required_numbers));

const number_case optional_numbers[] = {
    {url_add_optional_num_parameter_negative, INT64_MIN, "u?"},
    {url_add_optional_num_parameter_negative, -1, "u?"},
    {url_add_optional_num_parameter_negative, 0, "u?&key=0"},
    {url_add_optional_num_parameter_negative, 1, "u?&key=1"},
    {url_add_optional_num_parameter_negative, INT64_MAX, "u?&key=9223372036854775807"},
    {url_add_optional_num_parameter_zero, INT64_MIN, "u?"},
    {url_add_optional_num_parameter_zero, -5, "u?"},
    {url_add_optional_num_parameter_zero, -1, "u?"},
    {url_add_optional_num_parameter_zero, 0, "u?"},
    {url_add_optional_num_parameter_zero, 1, "u?&key=1"},
    {url_add_optional_num_parameter_zero, INT64_MAX, "u?&key=9223372036854775807"},
};
INSTANTIATE_TEST_SUITE_P(Optional, NumberParameter, testing::ValuesIn(optional_numbers));

} // namespace
} // namespace quillmere_test
