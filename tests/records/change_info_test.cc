// The one kind of record that holds numbers.
#include <gtest/gtest.h>

#include "quillmere.h"
#include "records/make_record.h"

namespace quillmere_test {
namespace {

owned_record<change_kind> change_with(uint64_t revision, int32_t is_folder, int32_t changetype)
{
    return owned_record<change_kind>(change_info_new(nullptr, nullptr, nullptr, revision, is_folder,
                                                     changetype, nullptr, nullptr, nullptr));
}

TEST(ChangeInfo, GivesBackEachNumberUnderItsName)
{
    owned_record<change_kind> change = change_with(7, 1, 2);

    EXPECT_EQ(change_info_get_revision(change.get()), 7u);
    EXPECT_EQ(change_info_get_is_folder(change.get()), 1);
    EXPECT_EQ(change_info_get_changetype(change.get()), 2);
}

TEST(ChangeInfo, KeepsNumbersUnchanged)
{
    owned_record<change_kind> greatest = change_with(UINT64_MAX, INT32_MAX, INT32_MAX);
    owned_record<change_kind> least = change_with(0, INT32_MIN, INT32_MIN);

    EXPECT_EQ(change_info_get_revision(greatest.get()), UINT64_MAX);
    EXPECT_EQ(change_info_get_is_folder(greatest.get()), INT32_MAX);
    EXPECT_EQ(change_info_get_changetype(greatest.get()), INT32_MAX);
    EXPECT_EQ(change_info_get_revision(least.get()), 0u);
    EXPECT_EQ(change_info_get_is_folder(least.get()), INT32_MIN);
    EXPECT_EQ(change_info_get_changetype(least.get()), INT32_MIN);
}

TEST(ChangeInfo, HasZeroForEveryNumberOfANullRecord)
{
    EXPECT_EQ(change_info_get_revision(nullptr), 0u);
    EXPECT_EQ(change_info_get_is_folder(nullptr), 0);
    EXPECT_EQ(change_info_get_changetype(nullptr), 0);
}

} // namespace
} // namespace quillmere_test
