// What holds for every kind of record.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "quillmere.h"
#include "records/make_record.h"

namespace quillmere_test {
namespace {

template <class Kind> class EveryRecord : public testing::Test {
protected:
    static constexpr auto &fields = Kind::texts;
};

TYPED_TEST_SUITE(EveryRecord, record_kinds, record_names);

TYPED_TEST(EveryRecord, GivesBackEachTextUnderItsName)
{
    owned_record<TypeParam> record(make_record<TypeParam>(names_of_fields<TypeParam>()));

    for (const auto &field : this->fields)
        EXPECT_STREQ(field.get(record.get()), field.name);
}

TYPED_TEST(EveryRecord, KeepsCopiesOfItsOwn)
{
    std::vector<std::string> originals;
    texts_of<TypeParam> texts = names_of_fields<TypeParam>();
    for (const char *&text : texts)
        originals.emplace_back(text);
    for (size_t index = 0; index < texts.size(); ++index)
        texts[index] = originals[index].c_str();
    owned_record<TypeParam> record(make_record<TypeParam>(texts));

    for (std::string &original : originals)
        original.assign(original.size(), '#');

    for (const auto &field : this->fields)
        EXPECT_STREQ(field.get(record.get()), field.name);
}

TYPED_TEST(EveryRecord, HasNullForTheOneTextThatWasNull)
{
    for (size_t missing = 0; missing < text_count<TypeParam>; ++missing) {
        texts_of<TypeParam> texts = names_of_fields<TypeParam>();
        texts[missing] = nullptr;

        owned_record<TypeParam> record(make_record<TypeParam>(texts));

        for (size_t index = 0; index < text_count<TypeParam>; ++index)
            EXPECT_STREQ(this->fields[index].get(record.get()), texts[index])
                << this->fields[index].name << " without " << this->fields[missing].name;
    }
}

TYPED_TEST(EveryRecord, MayBeMadeOfNothing)
{
    owned_record<TypeParam> record(make_record<TypeParam>({}));

    ASSERT_NE(record, nullptr);
    for (const auto &field : this->fields)
        EXPECT_EQ(field.get(record.get()), nullptr) << field.name;
}

TYPED_TEST(EveryRecord, KeepsTextsExactlyAsTheyAre)
{
    texts_of<TypeParam> texts = {};
    texts.fill(" \n\xc3\xa9 <&> 007 ");
    texts.front() = "";

    owned_record<TypeParam> record(make_record<TypeParam>(texts));

    for (size_t index = 0; index < text_count<TypeParam>; ++index)
        EXPECT_STREQ(this->fields[index].get(record.get()), texts[index]);
}

TYPED_TEST(EveryRecord, LendsTheSameTextEachTime)
{
    owned_record<TypeParam> record(make_record<TypeParam>(names_of_fields<TypeParam>()));

    for (const auto &field : this->fields)
        EXPECT_EQ(field.get(record.get()), field.get(record.get())) << field.name;
}

TYPED_TEST(EveryRecord, SharesNoTextBetweenFields)
{
    texts_of<TypeParam> texts = {};
    texts.fill("the same");
    owned_record<TypeParam> record(make_record<TypeParam>(texts));

    for (const auto &one : this->fields)
        for (const auto &other : this->fields)
            if (&one != &other) {
                EXPECT_NE(one.get(record.get()), other.get(record.get()))
                    << one.name << " and " << other.name;
            }
}

TYPED_TEST(EveryRecord, HasNullForEveryTextOfANullRecord)
{
    for (const auto &field : this->fields)
        EXPECT_EQ(field.get(nullptr), nullptr) << field.name;
}

TYPED_TEST(EveryRecord, IsNotMissedByItsDestructor)
{
    TypeParam::destroy(nullptr);

    typename TypeParam::record *none = nullptr;
    TypeParam::destroy(&none);

    EXPECT_EQ(none, nullptr);
}

TYPED_TEST(EveryRecord, LeavesTheCallersPointerAsItWas)
{
    typename TypeParam::record *record = make_record<TypeParam>(names_of_fields<TypeParam>());
    auto before = reinterpret_cast<uintptr_t>(record);

    TypeParam::destroy(&record);

    EXPECT_EQ(reinterpret_cast<uintptr_t>(record), before);
}

using file_kind = record_kind<file_info>;

TEST(FileInfo, HasNoHashIfTheTwelfthArgumentIsNull)
{
    texts_of<file_kind> texts = names_of_fields<file_kind>();
    texts[11] = nullptr;

    owned_record<file_kind> record(make_record<file_kind>(texts));

    EXPECT_EQ(file_info_get_hash(record.get()), nullptr);
}

} // namespace
} // namespace quillmere_test
