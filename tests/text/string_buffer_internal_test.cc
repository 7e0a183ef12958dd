// What the string buffer takes from the heap, and gives back.
#include <gtest/gtest.h>

#include "interpose/heap.h"
#include "text/buffer.h"

namespace quillmere_test {
namespace {

TEST(StringBufferMemory, IsTheRecordAloneWithoutCapacity)
{
    int64_t before = blocks_held();
    string_buffer *buffer = string_new(0);

    EXPECT_EQ(blocks_held(), before + 1);
    string_delete(buffer, 0);
    EXPECT_EQ(blocks_held(), before);
}

TEST(StringBufferMemory, IsGivenBackWithRangesCopyAndText)
{
    int64_t before = blocks_held();
    string_buffer *buffer = string_new(16);
    string_append_obfs(buffer, "secret");
    string_append_urlencode_obfs(buffer, "another one");
    string_get_obfs(buffer, nullptr);
    EXPECT_EQ(blocks_held(), before + 5);

    string_delete(buffer, 1);

    EXPECT_EQ(blocks_held(), before);
}

TEST(StringBufferMemory, IsGivenBackButForTheTextThatIsDetached)
{
    int64_t before = blocks_held();
    string_buffer *buffer = string_new(16);
    string_append_obfs(buffer, "secret");
    string_get_obfs(buffer, nullptr);
    char *text = buffer->bytes;

    string_delete(buffer, 0);

    EXPECT_EQ(blocks_held(), before + 1);
    api_free(text);
    EXPECT_EQ(blocks_held(), before);
}

TEST(StringBufferMemory, HoldsOneRedactedCopyAtATime)
{
    owned_buffer buffer = buffer_of("secret");
    string_add_obfs_range(buffer.get(), 0, 6);
    string_get_obfs(buffer.get(), nullptr);
    int64_t before = blocks_held();

    for (int count = 0; count < 10; ++count)
        string_get_obfs(buffer.get(), nullptr);

    EXPECT_EQ(blocks_held(), before);
}

TEST(StringBufferMemory, IsNotNeededForARedactedViewWithoutRanges)
{
    owned_buffer buffer = buffer_of("text");
    int64_t before = blocks_held();

    string_get_obfs(buffer.get(), nullptr);

    EXPECT_EQ(blocks_held(), before);
}

TEST(StringBufferMemory, IsNotLostToEncoding)
{
    owned_buffer buffer = new_buffer(64);
    int64_t before = blocks_held();

    string_append_urlencode(buffer.get(), "a b c");
    string_append_num(buffer.get(), 4096);

    EXPECT_EQ(blocks_held(), before);
}

} // namespace
} // namespace quillmere_test
