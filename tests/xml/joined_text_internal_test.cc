// What joining the pieces of a text asks of the heap.
#include "xml/joined_text.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "interpose/heap.h"
#include "xml/lookup.h"

namespace quillmere_test {
namespace {

TEST(JoinedText, IsWholeAfterEveryPiece)
{
    quillmere::joined_text text;
    char *value = nullptr;

    text.append(&value, "one, not this", 3);
    EXPECT_STREQ(value, "one");
    text.append(&value, "", 0);
    EXPECT_STREQ(value, "one");
    text.append(&value, " two", 4);
    EXPECT_STREQ(value, "one two");

    std::free(value);
}

TEST(JoinedText, IsAnEmptyTextAfterAnEmptyPiece)
{
    quillmere::joined_text text;
    char *value = nullptr;

    text.append(&value, "not this", 0);

    EXPECT_STREQ(value, "");
    std::free(value);
}

// A million pieces, which fit into a handful of allocations when each doubles the room.
constexpr size_t pieces = 1000 * 1000;
constexpr size_t handful = 40;

TEST(JoinedText, TakesAHandfulOfAllocationsForAMillionPieces)
{
    quillmere::joined_text text;
    char *value = nullptr;
    starved_heap heap(handful);

    for (size_t i = 0; i < pieces; ++i)
        text.append(&value, "x", 1);

    EXPECT_EQ(heap.refused(), 0u);
    EXPECT_EQ(std::string(value), std::string(pieces, 'x'));
    std::free(value);
}

TEST(JoinedText, IsWhatTheLookupUses)
{
    const std::string xml = "<r><a>" + std::string(pieces, '\n') + "</a></r>";
    int32_t parse_failed = 77;
    starved_heap heap(handful);

    char *value = simple_get_xml_node_value(xml.data(), xml.size(), "a", &parse_failed);

    EXPECT_EQ(heap.refused(), 0u);
    EXPECT_EQ(parse_failed, 0);
    EXPECT_EQ(std::string(value), std::string(pieces, '\n'));
    std::free(value);
}

class LookupBlocks : public testing::TestWithParam<const char *> {};

TEST_P(LookupBlocks, AreAllGivenBackButTheValue)
{
    std::FILE *before = output_file;
    output_file = std::fopen("/dev/null", "w");
    int64_t held = blocks_held();
    int32_t parse_failed = 77;
    const std::string xml = GetParam();

    char *value = simple_get_xml_node_value(xml.data(), xml.size(), "a", &parse_failed);

    EXPECT_EQ(blocks_held() - held, value ? 1 : 0);
    std::free(value);
    std::fclose(output_file);
    output_file = before;
}

INSTANTIATE_TEST_SUITE_P(Documents, LookupBlocks,
                         testing::Values("<r><a>1</a></r>", "<r><b>1</b></r>", "<r><a/></r>",
                                         "<r><a>1</a>", "not XML"));

} // namespace
} // namespace quillmere_test
