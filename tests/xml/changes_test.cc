#include <gtest/gtest.h>

#include <cstddef>
#include <memory>
#include <ostream>
#include <string>
#include <vector>

#include <expat.h>

#include "quillmere.h"
#include "records/descriptions.h"
#include "support/log_capture.h"
#include "xml/counting.h"

namespace quillmere_test {
namespace {

using texts = std::vector<std::string>;

constexpr uint32_t untouched_count = 77;

constexpr const char *nested_message =
    "simple_extract_changes: Attempt to create object in object!\n";

std::string log_of(uint32_t count, const std::string &between = "")
{
    return "xml extract: num changes: 0\n" + between +
           "xml extract: num changes: " + std::to_string(count) + "\n";
}

class Changes : public testing::Test {
protected:
    ~Changes() override { delete_all_change_list(&changes); }

    uint32_t read(const char *xml, uint64_t length)
    {
        return simple_extract_changes(xml, length, changes, &change_count);
    }
    uint32_t read(const std::string &xml) { return read(xml.data(), xml.size()); }

    log_capture log;
    change_list *changes = change_list_new();
    uint32_t change_count = untouched_count;
};

TEST_F(Changes, ListsTheFeedInReverse)
{
    EXPECT_EQ(read("<response><updated>"
                   "<files><file><quickkey>f1</quickkey><revision>1</revision></file></files>"
                   "<folders><folder><folderkey>d1</folderkey><revision>2</revision></folder>"
                   "</folders></updated><deleted>"
                   "<files><file><quickkey>f2</quickkey><revision>3</revision></file></files>"
                   "<folders><folder><folderkey>d2</folderkey><revision>4</revision></folder>"
                   "</folders></deleted></response>"),
              0u);

    EXPECT_EQ(change_count, 4u);
    EXPECT_EQ(descriptions_of(changes),
              (texts{"4 deleted folder: key=d2", "3 deleted file: key=f2",
                     "2 updated folder: key=d1", "1 updated file: key=f1"}));
    EXPECT_EQ(log.text(), log_of(4));
}

TEST_F(Changes, TakesEveryElementOfAFile)
{
    read("<r><updated><files><file><quickkey>1</quickkey><revision>2</revision>"
         "<parent_folderkey>3</parent_folderkey><created>4</created><filename>5</filename>"
         "<mimetype>6</mimetype><filetype>7</filetype></file></files></updated></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"2 updated file: key=1 parent_folderkey=3 created=4 "
                                              "filename=5 mimetype=6 filetype=7"});
}

TEST_F(Changes, TakesThreeElementsOfAFolder)
{
    read("<r><updated><folders><folder><folderkey>1</folderkey><revision>2</revision>"
         "<parent_folderkey>3</parent_folderkey><created>x</created><filename>x</filename>"
         "<mimetype>x</mimetype><filetype>x</filetype><quickkey>x</quickkey><name>x</name>"
         "</folder></folders></updated></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"2 updated folder: key=1 parent_folderkey=3"});
}

TEST_F(Changes, PassesOverWhatAFileDoesNotHave)
{
    read("<r><files><file><folderkey>x</folderkey><name>x</name><size>x</size></file></files></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: "});
}

TEST_F(Changes, TakesAFileWithoutSectionsForADeletedFile)
{
    read("<response><file><quickkey>k</quickkey></file></response>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: key=k"});
}

TEST_F(Changes, GoesByTheSectionAndNotByTheElementsName)
{
    read("<r><updated><folders><file><folderkey>a</folderkey></file></folders>"
         "<files><folder><quickkey>b</quickkey></folder></files></updated></r>");

    EXPECT_EQ(descriptions_of(changes),
              (texts{"0 updated file: key=b", "0 updated folder: key=a"}));
}

TEST_F(Changes, KeepsASectionsMeaningBehindItsEnd)
{
    read("<r><updated><folders/></updated><file><folderkey>k</folderkey></file></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 updated folder: key=k"});
}

TEST_F(Changes, TakesTheKindFromTheKeyWhereTheSectionChangesInARecord)
{
    read("<r><file><folders/><folderkey>d</folderkey></file>"
         "<file><files/><quickkey>f</quickkey></file>"
         "<file><folders/></file></r>");

    EXPECT_EQ(descriptions_of(changes),
              (texts{"0 deleted file: ", "0 deleted file: key=f", "0 deleted folder: key=d"}));
}

// The rows of both kinds lead to the same fields.
TEST_F(Changes, JoinsTheTextsOfBothKindsInOneRecord)
{
    read("<r><folders><folder><folderkey>a key that is longer than the next, &amp;</folderkey>"
         "<parent_folderkey>and &amp; so is this one</parent_folderkey></folder></folders>"
         "<files><file><quickkey>a</quickkey><parent_folderkey>b</parent_folderkey>"
         "<folders/><folderkey>c</folderkey><parent_folderkey>d</parent_folderkey>"
         "<files/><quickkey>e</quickkey><parent_folderkey>f</parent_folderkey></file></files></r>");

    EXPECT_EQ(descriptions_of(changes).front(), "0 deleted file: key=ace parent_folderkey=bdf");
}

TEST_F(Changes, HasTheChangeTypeAtTheStartOfTheRecord)
{
    read("<r><updated/><file><deleted/><quickkey>k</quickkey></file></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 updated file: key=k"});
}

struct revision_case {
    const char *text;
    uint64_t number;
};

std::ostream &operator<<(std::ostream &stream, const revision_case &tested)
{
    return stream << tested.text;
}

class ChangeRevision : public Changes, public testing::WithParamInterface<revision_case> {};

TEST_P(ChangeRevision, IsAnUnsignedDecimalNumber)
{
    read(std::string("<r><file><revision>") + GetParam().text + "</revision></file></r>");

    ASSERT_NE(changes->next, nullptr);
    EXPECT_EQ(change_info_get_revision(changes->next->record), GetParam().number);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, ChangeRevision,
    testing::Values(revision_case{"12", 12}, revision_case{"", 0}, revision_case{"abc", 0},
                    revision_case{" 7 ", 7}, revision_case{"5x", 5}, revision_case{"010", 10},
                    revision_case{"0x10", 0}, revision_case{"4294967296", 4294967296},
                    revision_case{"18446744073709551615", UINT64_MAX},
                    revision_case{"99999999999999999999", UINT64_MAX},
                    revision_case{"-1", UINT64_MAX},
                    // Text that arrives in pieces counts from the last piece alone.
                    revision_case{"12&#51;", 3}, revision_case{"12&amp;34", 34},
                    revision_case{"12<!-- -->34", 34}, revision_case{"12&#120;", 0}));

TEST_F(Changes, HasTheLastOfSeveralRevisions)
{
    read("<r><file><revision>1</revision><revision>2</revision></file>"
         "<folders/><folder><revision>3</revision><revision>4</revision></folder></r>");

    EXPECT_EQ(descriptions_of(changes), (texts{"4 deleted folder: ", "2 deleted file: "}));
}

TEST_F(Changes, HasRevisionZeroWhereNoneIsGiven)
{
    read("<r><file><revision/></file><file/></r>");

    EXPECT_EQ(descriptions_of(changes), (texts{"0 deleted file: ", "0 deleted file: "}));
}

TEST_F(Changes, JoinsPiecesAndRepeatedElements)
{
    read("<r><file><filename>a&amp;b</filename><quickkey>k</quickkey><filename>c</filename>"
         "</file></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: key=k filename=a&bc"});
}

TEST_F(Changes, EndsAnElementsTextAtAChild)
{
    read("<r><file>x<filename>before<b>inside</b>behind</filename>y</file></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: filename=before"});
}

TEST_F(Changes, IgnoresTextOutsideRecords)
{
    read("<r><quickkey>x</quickkey><revision>9</revision><file><quickkey>k</quickkey></file>"
         "<quickkey>x</quickkey></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: key=k"});
}

TEST_F(Changes, ReadsAFeedWithoutChanges)
{
    EXPECT_EQ(read("<response><updated/></response>"), 0u);

    EXPECT_EQ(change_count, 0u);
    EXPECT_EQ(changes->next, nullptr);
    EXPECT_EQ(log.text(), log_of(0));
}

TEST_F(Changes, TakesNamesExactly)
{
    read("<r><Updated/><Folders/><File/><folder2/><file/></r>");

    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: "});
}

struct nested_case {
    const char *name;
    const char *inside; // what stands in the outer record behind its key
};

std::ostream &operator<<(std::ostream &stream, const nested_case &tested)
{
    return stream << tested.name;
}

class NestedChange : public Changes, public testing::WithParamInterface<nested_case> {};

TEST_P(NestedChange, StopsTheReading)
{
    EXPECT_EQ(read(std::string("<r><file><quickkey>done</quickkey></file>"
                               "<file><quickkey>open</quickkey>") +
                   GetParam().inside + "</file><file><quickkey>late</quickkey></file></r>"),
              1u);

    EXPECT_EQ(change_count, 1u);
    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: key=done"});
    EXPECT_EQ(log.text(), log_of(1, nested_message));
}

INSTANTIATE_TEST_SUITE_P(
    Objects, NestedChange,
    testing::Values(nested_case{"file", "<file><quickkey>in</quickkey></file>"},
                    nested_case{"folder", "<folder>text</folder>"},
                    nested_case{"deep", "<a><b><file></file></b></a>"},
                    nested_case{"empty_file", "<file/>"}, nested_case{"empty_folder", "<folder/>"},
                    nested_case{"empty_then_more", "<file/><file/>x"}),
    [](const auto &tested) { return std::string(tested.param.name); });

TEST_F(Changes, TouchesNothingWithoutText)
{
    EXPECT_EQ(read(nullptr, 5), 0u);
    EXPECT_EQ(read("<r><file/></r>", 0), 0u);

    EXPECT_EQ(change_count, untouched_count);
    EXPECT_EQ(changes->next, nullptr);
    EXPECT_EQ(log.text(), "");
}

TEST_F(Changes, ReadsNoFurtherThanItsLength)
{
    std::string xml = "<r><file/></r>";

    EXPECT_EQ(read((xml + "trailing rubbish").c_str(), xml.size()), 0u);

    EXPECT_EQ(change_count, 1u);
}

TEST_F(Changes, GoesByTheLow32BitsOfTheLength)
{
    std::string xml = "<r><file/></r>";

    EXPECT_EQ(read(xml.c_str(), xml.size() + (uint64_t{1} << 32)), 0u);

    EXPECT_EQ(change_count, 1u);
}

TEST_F(Changes, KeepsWhatWasFinishedBeforeDamage)
{
    EXPECT_EQ(read("<r><file><quickkey>a</quickkey></file><file><quickkey>open</quickkey></r>"),
              1u);

    EXPECT_EQ(change_count, 1u);
    EXPECT_EQ(descriptions_of(changes), texts{"0 deleted file: key=a"});
    EXPECT_EQ(log.text(), log_of(1));
}

TEST_F(Changes, ReportsWhatIsNoXml)
{
    EXPECT_EQ(read("no markup"), 1u);

    EXPECT_EQ(change_count, 0u);
    EXPECT_EQ(log.text(), log_of(0));
}

TEST_F(Changes, ReportsADocumentCutOffAnywhere)
{
    const std::string whole =
        "<r><updated><files><file><quickkey>a</quickkey><revision>12</revision></file></files>"
        "</updated><deleted><folders><folder><folderkey>b&amp;c</folderkey></folder></folders>"
        "</deleted></r>";

    for (size_t length = 1; length < whole.size(); ++length) {
        std::string part = whole.substr(0, length);
        EXPECT_EQ(read(part), 1u) << part;
        EXPECT_EQ(change_count, static_cast<uint32_t>(occurrences("</file>", part) +
                                                      occurrences("</folder>", part)))
            << part;
    }
}

TEST(ChangesState, HasThePublicLayout)
{
    EXPECT_EQ(offsetof(changes_state, parser), 0u);
    EXPECT_EQ(offsetof(changes_state, current_change), 8u);
    EXPECT_EQ(offsetof(changes_state, changes), 16u);
    EXPECT_EQ(offsetof(changes_state, current_element), 24u);
    EXPECT_EQ(offsetof(changes_state, change_count), 32u);
    EXPECT_EQ(offsetof(changes_state, change_type), 36u);
    EXPECT_EQ(offsetof(changes_state, object_kind), 40u);
    EXPECT_EQ(offsetof(changes_state, in_object), 44u);
    EXPECT_EQ(sizeof(changes_state), 48u);
}

class ChangesCallbacks : public testing::Test {
protected:
    ChangesCallbacks()
    {
        state.parser = parser.get();
        state.changes = change_list_new();
    }
    ~ChangesCallbacks() override
    {
        api_free(state.current_element);
        if (state.in_object)
            change_info_delete(&state.current_change);
        delete_all_change_list(&state.changes);
    }

    void start(const char *element)
    {
        simple_extract_changes_node_value_start(&state, element, nullptr);
    }
    void end(const char *element) { simple_extract_changes_node_value_end(&state, element); }
    void data(const std::string &text)
    {
        simple_extract_changes_node_value_data(&state, text.data(),
                                               static_cast<int32_t>(text.size()));
    }

    log_capture log;
    std::unique_ptr<XML_ParserStruct, void (*)(XML_Parser)> parser{XML_ParserCreate("UTF-8"),
                                                                   XML_ParserFree};
    changes_state state = {};
};

TEST_F(ChangesCallbacks, EnterTheSections)
{
    start("updated");
    start("folders");

    EXPECT_EQ(state.change_type, 1);
    EXPECT_EQ(state.object_kind, 1);
    EXPECT_EQ(state.in_object, 0);
    EXPECT_STREQ(state.current_element, "folders");

    end("folders");
    end("updated");
    EXPECT_EQ(state.change_type, 1);
    EXPECT_EQ(state.object_kind, 1);

    start("deleted");
    start("files");
    EXPECT_EQ(state.change_type, 0);
    EXPECT_EQ(state.object_kind, 0);
}

TEST_F(ChangesCallbacks, OpenAChangeOfTheSectionsKind)
{
    state.change_type = 1;
    state.object_kind = 1;

    start("file");

    EXPECT_EQ(state.in_object, 1);
    EXPECT_EQ(description_of(state.current_change), "0 updated folder: ");
    EXPECT_EQ(state.change_count, 0);
}

TEST_F(ChangesCallbacks, ListAFinishedChange)
{
    start("folder");
    change_info *change = state.current_change;

    end("folder");

    ASSERT_NE(state.changes->next, nullptr);
    EXPECT_EQ(state.changes->next->record, change);
    EXPECT_EQ(state.in_object, 0);
    EXPECT_EQ(state.change_count, 1);
    EXPECT_EQ(state.current_element, nullptr);
}

TEST_F(ChangesCallbacks, AppendPiecesOfTextButNotOfRevisions)
{
    start("file");
    start("filename");
    data("pie");
    data("ces");
    end("filename");
    start("revision");
    data("12");
    data("34");

    EXPECT_EQ(description_of(state.current_change), "34 deleted file: filename=pieces");
}

TEST_F(ChangesCallbacks, AppendToTextsOfBothKinds)
{
    start("file");
    start("quickkey");
    data("file+");
    state.object_kind = 1;
    start("folderkey");
    data("folder");

    EXPECT_EQ(description_of(state.current_change), "0 deleted folder: key=file+folder");
}

TEST_F(ChangesCallbacks, ReadNumbersThatNoNulFollows)
{
    start("file");
    start("revision");

    simple_extract_changes_node_value_data(&state, "123456", 3);

    EXPECT_EQ(description_of(state.current_change), "123 deleted file: ");
}

TEST_F(ChangesCallbacks, IgnoreTextWithoutAnOpenChangeOrAnElement)
{
    start("quickkey");
    data("no change");
    start("file");
    end("quickkey");

    data("no element");

    EXPECT_EQ(description_of(state.current_change), "0 deleted file: ");
}

TEST_F(ChangesCallbacks, StopTheParserForGoodAtANestedChange)
{
    XML_SetUserData(parser.get(), &state);
    XML_SetElementHandler(parser.get(), simple_extract_changes_node_value_start,
                          simple_extract_changes_node_value_end);
    XML_SetCharacterDataHandler(parser.get(), simple_extract_changes_node_value_data);
    const std::string xml = "<r><file><quickkey>k</quickkey><folder></folder></file></r>";

    XML_Status status = XML_Parse(parser.get(), xml.data(), static_cast<int>(xml.size()), XML_TRUE);

    EXPECT_EQ(status, XML_STATUS_ERROR);
    EXPECT_EQ(XML_GetErrorCode(parser.get()), XML_ERROR_ABORTED);
    EXPECT_EQ(XML_ResumeParser(parser.get()), XML_STATUS_ERROR);
    EXPECT_EQ(description_of(state.current_change), "0 deleted file: key=k");
    EXPECT_EQ(state.in_object, 1);
    EXPECT_STREQ(state.current_element, "folder");
    EXPECT_EQ(log.text(), nested_message);
}

TEST_F(ChangesCallbacks, KeepTheOpenChangeWhenAnotherStarts)
{
    state.parser = nullptr;
    start("file");
    change_info *change = state.current_change;

    start("folder");

    EXPECT_EQ(state.current_change, change);
    EXPECT_EQ(state.in_object, 1);
    EXPECT_EQ(log.text(), nested_message);
}

} // namespace
} // namespace quillmere_test
