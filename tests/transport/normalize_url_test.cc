#include <gtest/gtest.h>

#include <string>

#include "quillmere.h"

namespace quillmere_test {
namespace {

struct link {
    const char *url;
    const char *scheme;
    const char *normalized;
};

void PrintTo(const link &each, std::ostream *out)
{
    *out << '"' << each.url << "\" with " << (each.scheme ? each.scheme : "no scheme");
}

class NormalizeUrl : public testing::TestWithParam<link> {};

TEST_P(NormalizeUrl, GivesALinkItsScheme)
{
    const link &each = GetParam();

    char *normalized = normalize_url(each.url, each.scheme);

    EXPECT_STREQ(normalized, each.normalized);
    EXPECT_NE(normalized, each.url);
    api_free(normalized);
}

INSTANTIATE_TEST_SUITE_P(
    Links, NormalizeUrl,
    testing::Values(
        // without a scheme
        link{"//host/path", "https", "https://host/path"}, link{"//h", "https", "https://h"},
        link{"///", "https", "https:///"}, link{"////", "x", "x:////"},
        link{"//host/path", "", "://host/path"},
        // with one
        link{"http://host/path", "https", "http://host/path"}, link{"://host", "https", "://host"},
        link{"http://host//path", "https", "http://host//path"},
        // the first "//" decides
        link{"//host/http://other", "https", "https://host/http://other"},
        link{"host//path://", "https", "https:host//path://"}, link{"a//b", "https", "https:a//b"},
        link{"http//host", "https", "https:http//host"},
        // too short, or nothing behind the slashes
        link{"//", "https", "//"}, link{"/", "https", "/"}, link{"", "https", ""},
        link{"a//", "https", "a//"}, link{"host//", "https", "host//"},
        link{"a:///", "https", "a:///"},
        // no slashes at all
        link{"host/path", "https", "host/path"}, link{"mailto:someone", "https", "mailto:someone"},
        // no scheme to give
        link{"//host/path", nullptr, "//host/path"}, link{"a//b", nullptr, "a//b"},
        link{"http://host", nullptr, "http://host"}));

TEST(NormalizeUrlWithoutAUrl, GivesNull)
{
    EXPECT_EQ(normalize_url(nullptr, "https"), nullptr);
    EXPECT_EQ(normalize_url(nullptr, nullptr), nullptr);
}

} // namespace
} // namespace quillmere_test
