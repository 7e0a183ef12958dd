// The public structures' layout, on which callers that were compiled earlier rely.
#include <gtest/gtest.h>

#include "interface/layout.h"
#include "quillmere.h"

namespace quillmere_test {
namespace {

TEST(PublicLayout, IsAsItWasPromised)
{
    ASSERT_GT(layout_entry_count, 65u);
    for (size_t index = 0; index < layout_entry_count; ++index) {
        const layout_entry &entry = layout_entries[index];
        EXPECT_EQ(entry.actual, entry.expected) << entry.what;
    }
}

TEST(Statuses, HaveTheirNumbers)
{
    EXPECT_EQ(QM_OK, 0);
    EXPECT_EQ(QM_NO_ERROR_ELEMENT, -1);
    EXPECT_EQ(QM_NO_RESPONSE, -2);
    EXPECT_EQ(QM_UNUSABLE_RESPONSE, -3);
    EXPECT_EQ(QM_SIGNATURE_FAILED, -4);
    EXPECT_EQ(QM_UNUSABLE_ERROR_NUMBER, -8);
    EXPECT_EQ(QM_MALFORMED_REPLY, -9);
}

} // namespace
} // namespace quillmere_test
