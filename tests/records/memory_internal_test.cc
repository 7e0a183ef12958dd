// What the records take from the heap, and give back.
#include <gtest/gtest.h>

#include "interpose/heap.h"
#include "records/make_record.h"

namespace quillmere_test {
namespace {

template <class Kind> class RecordMemory : public testing::Test {
};
TYPED_TEST_SUITE(RecordMemory, record_kinds, record_names);

TYPED_TEST(RecordMemory, IsTheRecordAndOneBlockForEachTextAndAllGivenBack)
{
    int64_t before = blocks_held();

    typename TypeParam::record *record = make_record<TypeParam>(names_of_fields<TypeParam>());
    EXPECT_EQ(blocks_held(), before + 1 + static_cast<int64_t>(text_count<TypeParam>));

    TypeParam::destroy(&record);
    EXPECT_EQ(blocks_held(), before);
}

TYPED_TEST(RecordMemory, IsTheRecordAloneWithoutTexts)
{
    int64_t before = blocks_held();

    typename TypeParam::record *record = make_record<TypeParam>({});
    EXPECT_EQ(blocks_held(), before + 1);

    TypeParam::destroy(&record);
    EXPECT_EQ(blocks_held(), before);
}

} // namespace
} // namespace quillmere_test
