// What holds for the lists of every kind of record.
#include <gtest/gtest.h>

#include <cstddef>
#include <string>
#include <type_traits>
#include <vector>

#include "quillmere.h"
#include "records/descriptions.h"

namespace quillmere_test {
namespace {

struct file_lists {
    using list = file_list;
    static constexpr auto create = file_info_list_new;
    static constexpr auto add = add_to_file_list;
    static constexpr auto delete_all = delete_all_file_list;
    static file_info *record(const char *name)
    {
        return file_info_new(name, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                             nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                             nullptr, nullptr, nullptr);
    }
    static std::string described(const std::string &name) { return "quickkey=" + name; }
};

struct folder_lists {
    using list = folder_list;
    static constexpr auto create = folder_info_list_new;
    static constexpr auto add = add_to_folder_list;
    static constexpr auto delete_all = delete_all_folder_list;
    static folder_info *record(const char *name)
    {
        return folder_info_new(name, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                               nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                               nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                               nullptr, nullptr);
    }
    static std::string described(const std::string &name) { return "folderkey=" + name; }
};

struct change_lists {
    using list = change_list;
    static constexpr auto create = change_list_new;
    static constexpr auto add = add_to_change_list;
    static constexpr auto delete_all = delete_all_change_list;
    static change_info *record(const char *name)
    {
        return change_info_new(name, nullptr, nullptr, 7, 1, 1, nullptr, nullptr, nullptr);
    }
    static std::string described(const std::string &name)
    {
        return "7 updated folder: key=" + name;
    }
};

struct file_links_lists {
    using list = file_links_list;
    static constexpr auto create = file_links_list_new;
    static constexpr auto add = add_to_file_links_list;
    static constexpr auto delete_all = delete_all_file_links_list;
    static file_links *record(const char *name)
    {
        return file_links_new(name, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                              nullptr, nullptr, nullptr, nullptr, nullptr);
    }
    static std::string described(const std::string &name) { return "quickkey=" + name; }
};

using kinds = testing::Types<file_lists, folder_lists, change_lists, file_links_lists>;

class list_names {
public:
    template <class Kind> static std::string GetName(int index)
    {
        static const char *const names[] = {"files", "folders", "changes", "links"};
        return names[index];
    }
};

template <class Kind> class EveryList : public testing::Test {
protected:
    ~EveryList() override { Kind::delete_all(&records); }

    void add(const char *name) { Kind::add(records, Kind::record(name)); }

    typename Kind::list *records = Kind::create();
};

TYPED_TEST_SUITE(EveryList, kinds, list_names);

TYPED_TEST(EveryList, IsNewWithNothingButItsFirstNode)
{
    ASSERT_NE(this->records, nullptr);
    EXPECT_EQ(this->records->record, nullptr);
    EXPECT_EQ(this->records->next, nullptr);
}

TYPED_TEST(EveryList, HasThePublicLayout)
{
    using list = typename TypeParam::list;

    EXPECT_EQ(offsetof(list, record), 0u);
    EXPECT_EQ(offsetof(list, next), sizeof(void *));
    EXPECT_EQ(sizeof(list), 2 * sizeof(void *));
}

TYPED_TEST(EveryList, HoldsItsNewestRecordFirst)
{
    this->add("first");
    this->add("second");
    this->add("third");

    EXPECT_EQ(
        descriptions_of(this->records),
        (std::vector<std::string>{TypeParam::described("third"), TypeParam::described("second"),
                                  TypeParam::described("first")}));
}

TYPED_TEST(EveryList, KeepsItsFirstNodeWithoutARecord)
{
    auto *before = this->records;

    this->add("only");

    EXPECT_EQ(this->records, before);
    EXPECT_EQ(this->records->record, nullptr);
}

TYPED_TEST(EveryList, TakesTheRecordItself)
{
    auto *record = TypeParam::record("own");

    TypeParam::add(this->records, record);

    ASSERT_NE(this->records->next, nullptr);
    EXPECT_EQ(this->records->next->record, record);
}

TYPED_TEST(EveryList, IgnoresAMissingRecord)
{
    TypeParam::add(this->records, nullptr);

    EXPECT_EQ(this->records->next, nullptr);
}

TYPED_TEST(EveryList, LeavesTheRecordToTheCallerWhenThereIsNoList)
{
    auto *record = TypeParam::record("orphan");

    TypeParam::add(nullptr, record);

    EXPECT_EQ(description_of(record), TypeParam::described("orphan"));
    TypeParam::add(this->records, record);
}

TYPED_TEST(EveryList, IgnoresAMissingListAndAMissingRecordTogether)
{
    TypeParam::add(nullptr, nullptr);
}

TYPED_TEST(EveryList, LeavesThePointerAsItWasWhenItIsDeleted)
{
    typename TypeParam::list *deleted = TypeParam::create();
    TypeParam::add(deleted, TypeParam::record("gone"));
    auto before = reinterpret_cast<uintptr_t>(deleted);

    TypeParam::delete_all(&deleted);

    EXPECT_EQ(reinterpret_cast<uintptr_t>(deleted), before);
}

TYPED_TEST(EveryList, DoesNothingWhenNothingIsToBeDeleted)
{
    typename TypeParam::list *none = nullptr;

    TypeParam::delete_all(nullptr);
    TypeParam::delete_all(&none);

    EXPECT_EQ(none, nullptr);
}

TYPED_TEST(EveryList, TakesAHundredThousandRecords)
{
    constexpr size_t many = 100000;

    for (size_t index = 0; index < many; ++index)
        this->add(std::to_string(index).c_str());

    auto descriptions = descriptions_of(this->records);
    ASSERT_EQ(descriptions.size(), many);
    EXPECT_EQ(descriptions.front(), TypeParam::described("99999"));
    EXPECT_EQ(descriptions.back(), TypeParam::described("0"));
}

} // namespace
} // namespace quillmere_test
