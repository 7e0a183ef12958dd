// The version that the library tells, which the build reads from the header as well.
#include <gtest/gtest.h>

#include <string>

#include "quillmere.h"

namespace quillmere_test {
namespace {

TEST(Version, IsThatOfTheHeader)
{
    std::string expected = std::to_string(QUILLMERE_VERSION_MAJOR) + "." +
                           std::to_string(QUILLMERE_VERSION_MINOR) + "." +
                           std::to_string(QUILLMERE_VERSION_PATCH);

    EXPECT_EQ(quillmere_version(), expected);
}

TEST(Version, IsThatOfTheBuild) { EXPECT_STREQ(quillmere_version(), QUILLMERE_BUILD_VERSION); }

} // namespace
} // namespace quillmere_test
