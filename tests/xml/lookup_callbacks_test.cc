// The lookup's callbacks one by one, as a program with a parser of its own would use them.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <string>

#include <expat.h>

#include "quillmere.h"

namespace quillmere_test {
namespace {

class LookupCallbacks : public testing::Test {
protected:
    ~LookupCallbacks() override
    {
        std::free(state.value);
        string_delete(state.path, 1);
    }

    void start(const char *element) { simple_get_xml_node_value_start(&state, element, nullptr); }
    void end(const char *element) { simple_get_xml_node_value_end(&state, element); }
    void text(const std::string &piece)
    {
        simple_get_xml_node_value_data(&state, piece.data(), static_cast<int32_t>(piece.size()));
    }
    std::string path() const { return string_get(state.path); }

    node_value_state state = {"sought", nullptr, 0, 0, string_new(64)};
};

TEST_F(LookupCallbacks, KeepThePathBelowTheRoot)
{
    start("response");
    EXPECT_EQ(path(), "");
    EXPECT_EQ(state.depth, 1);

    start("folder_info");
    EXPECT_EQ(path(), "/folder_info");
    start("name");
    EXPECT_EQ(path(), "/folder_info/name");
    EXPECT_EQ(state.depth, 3);

    end("name");
    EXPECT_EQ(path(), "/folder_info");
    end("folder_info");
    EXPECT_EQ(path(), "");
    end("response");
    EXPECT_EQ(path(), "");
    EXPECT_EQ(state.depth, 0);
}

TEST_F(LookupCallbacks, CollectFromTheSoughtNameOn)
{
    start("response");
    EXPECT_EQ(state.collecting, 0);

    start("sought");

    EXPECT_EQ(state.collecting, 1);
}

TEST_F(LookupCallbacks, CollectFromTheRootOnIfItIsSought)
{
    start("sought");

    EXPECT_EQ(state.collecting, 1);
}

TEST_F(LookupCallbacks, CollectFromTheSoughtPathOn)
{
    state.sought = "/a/b";
    start("response");
    start("b");
    EXPECT_EQ(state.collecting, 0);
    end("b");
    start("a");
    EXPECT_EQ(state.collecting, 0);

    start("b");

    EXPECT_EQ(state.collecting, 1);
}

TEST_F(LookupCallbacks, GoOnCollectingInAChild)
{
    start("response");
    start("sought");

    start("child");

    EXPECT_EQ(state.collecting, 1);
}

TEST_F(LookupCallbacks, StopCollectingAtAnyEnd)
{
    start("response");
    start("sought");
    start("child");

    end("child");

    EXPECT_EQ(state.collecting, 0);
}

TEST_F(LookupCallbacks, KeepTextOnlyWhileCollecting)
{
    start("response");
    text("before");
    EXPECT_EQ(state.value, nullptr);
    start("sought");
    text("one ");
    text("two");
    end("sought");
    text("after");

    EXPECT_STREQ(state.value, "one two");
}

TEST_F(LookupCallbacks, KeepTheValueAtANewMatch)
{
    start("response");
    start("sought");
    text("A");
    end("sought");

    start("sought");

    EXPECT_STREQ(state.value, "A");
    text("B");
    EXPECT_STREQ(state.value, "AB");
}

TEST_F(LookupCallbacks, ServeAParserOfTheProgramsOwn)
{
    const std::string xml = "<response><a>1</a><sought>va&amp;l\nue</sought></response>";
    XML_Parser parser = XML_ParserCreate("UTF-8");
    XML_SetUserData(parser, &state);
    XML_SetElementHandler(parser, simple_get_xml_node_value_start, simple_get_xml_node_value_end);
    XML_SetCharacterDataHandler(parser, simple_get_xml_node_value_data);

    for (const char &each : xml)
        ASSERT_EQ(XML_Parse(parser, &each, 1, &each == &xml.back()), XML_STATUS_OK);

    XML_ParserFree(parser);
    EXPECT_STREQ(state.value, "va&l\nue");
    EXPECT_EQ(state.depth, 0);
}

TEST(NodeValueDataAccumulate, MakesAndGrowsAValue)
{
    char *value = nullptr;

    node_value_data_accumulate(&value, "one, not this", 3);
    EXPECT_STREQ(value, "one");
    node_value_data_accumulate(&value, " two", 4);
    EXPECT_STREQ(value, "one two");

    std::free(value);
}

TEST(NodeValueDataAccumulate, MakesAnEmptyValueOfNothing)
{
    char *value = nullptr;

    node_value_data_accumulate(&value, "not this", 0);
    EXPECT_STREQ(value, "");
    node_value_data_accumulate(&value, "this", 4);
    EXPECT_STREQ(value, "this");

    std::free(value);
}

TEST(NodeValueDataAccumulate, GrowsAValueThatTheProgramHasChanged)
{
    auto *value = static_cast<char *>(std::malloc(20));
    std::strcpy(value, "short");

    node_value_data_accumulate(&value, "er", 2);

    EXPECT_STREQ(value, "shorter");
    std::free(value);
}

} // namespace
} // namespace quillmere_test
