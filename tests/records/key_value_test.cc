#include <gtest/gtest.h>

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "quillmere.h"

namespace quillmere_test {
namespace {

struct list_deleter {
    void operator()(key_value *list) const { key_value_delete(list); }
};
using owned_list = std::unique_ptr<key_value, list_deleter>;

std::vector<std::string> keys_of(const key_value *list)
{
    std::vector<std::string> keys;
    for (const key_value *pair = list; pair; pair = key_value_get_next_pair(pair))
        keys.push_back(key_value_get_key(pair));
    return keys;
}

TEST(KeyValue, HoldsThePairItWasMadeOf)
{
    owned_list pair(key_value_new("key", "value"));

    EXPECT_STREQ(key_value_get_key(pair.get()), "key");
    EXPECT_STREQ(key_value_get_value(pair.get()), "value");
    EXPECT_EQ(key_value_get_next_pair(pair.get()), nullptr);
}

TEST(KeyValue, KeepsCopiesOfItsOwn)
{
    std::string key = "key";
    std::string value = "value";
    owned_list pair(key_value_new(key.c_str(), value.c_str()));

    key.assign("###");
    value.assign("#####");

    EXPECT_STREQ(key_value_get_key(pair.get()), "key");
    EXPECT_STREQ(key_value_get_value(pair.get()), "value");
}

TEST(KeyValue, HasNullForAMissingKey)
{
    owned_list pair(key_value_new(nullptr, "value"));

    EXPECT_EQ(key_value_get_key(pair.get()), nullptr);
    EXPECT_STREQ(key_value_get_value(pair.get()), "value");
}

TEST(KeyValue, HasNullForAMissingValue)
{
    owned_list pair(key_value_new("key", nullptr));

    EXPECT_STREQ(key_value_get_key(pair.get()), "key");
    EXPECT_EQ(key_value_get_value(pair.get()), nullptr);
}

TEST(KeyValue, TellsAnEmptyTextFromNone)
{
    owned_list pair(key_value_new("", ""));

    EXPECT_STREQ(key_value_get_key(pair.get()), "");
    EXPECT_STREQ(key_value_get_value(pair.get()), "");
}

TEST(KeyValue, KeepsPairsInTheOrderOfAddition)
{
    owned_list list(key_value_new("a", "1"));
    key_value_add(list.get(), "b", "2");
    key_value_add(list.get(), "c", "3");

    EXPECT_EQ(keys_of(list.get()), (std::vector<std::string>{"a", "b", "c"}));
}

TEST(KeyValue, ReturnsTheNodeOfAnAddedPair)
{
    owned_list list(key_value_new("a", "1"));

    key_value *added = key_value_add(list.get(), "b", "2");

    EXPECT_EQ(added, key_value_get_next_pair(list.get()));
    EXPECT_STREQ(key_value_get_key(added), "b");
    EXPECT_STREQ(key_value_get_value(added), "2");
    EXPECT_EQ(key_value_get_next_pair(added), nullptr);
}

TEST(KeyValue, AddsCopiesOfItsOwn)
{
    owned_list list(key_value_new("a", "1"));
    std::string key = "key";
    std::string value = "value";
    key_value *added = key_value_add(list.get(), key.c_str(), value.c_str());

    key.assign("###");
    value.assign("#####");

    EXPECT_STREQ(key_value_get_key(added), "key");
    EXPECT_STREQ(key_value_get_value(added), "value");
}

TEST(KeyValue, AddsAPairWithoutTexts)
{
    owned_list list(key_value_new("a", "1"));

    key_value *added = key_value_add(list.get(), nullptr, nullptr);

    ASSERT_NE(added, nullptr);
    EXPECT_EQ(key_value_get_key(added), nullptr);
    EXPECT_EQ(key_value_get_value(added), nullptr);
}

TEST(KeyValue, AddsAtTheEndFromAnyNode)
{
    owned_list list(key_value_new("a", "1"));
    key_value *second = key_value_add(list.get(), "b", "2");
    key_value_add(second, "c", "3");

    key_value_add(second, "d", "4");

    EXPECT_EQ(keys_of(list.get()), (std::vector<std::string>{"a", "b", "c", "d"}));
}

TEST(KeyValue, AddsNothingWithoutAList) { EXPECT_EQ(key_value_add(nullptr, "a", "1"), nullptr); }

TEST(KeyValue, HasNothingBehindAMissingNode)
{
    EXPECT_EQ(key_value_get_next_pair(nullptr), nullptr);
}

TEST(KeyValue, DeletesNothingWithoutAList) { key_value_delete(nullptr); }

TEST(KeyValue, CanBeDeletedFromANodeOn)
{
    owned_list list(key_value_new("a", "1"));
    key_value_add(list.get(), "b", "2");
    key_value_add(list.get(), "c", "3");

    key_value_delete(key_value_get_next_pair(list.get()));
    list->next = nullptr;

    EXPECT_EQ(keys_of(list.get()), std::vector<std::string>{"a"});
}

TEST(KeyValue, HasThePublicLayout)
{
    EXPECT_EQ(offsetof(key_value, key), 0u);
    EXPECT_EQ(offsetof(key_value, value), sizeof(void *));
    EXPECT_EQ(offsetof(key_value, next), 2 * sizeof(void *));
    EXPECT_EQ(sizeof(key_value), 3 * sizeof(void *));
}

} // namespace
} // namespace quillmere_test
