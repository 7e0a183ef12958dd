#include <gtest/gtest.h>

#include <cstddef>
#include <string>
#include <vector>

#include "quillmere.h"
#include "records/descriptions.h"
#include "support/log_capture.h"
#include "xml/counting.h"

namespace quillmere_test {
namespace {

using texts = std::vector<std::string>;

constexpr int32_t untouched_number = -77;

// Two lists of the test's own and what a reading did to them.
class FolderContent : public testing::Test {
protected:
    ~FolderContent() override
    {
        delete_all_file_list(&files);
        delete_all_folder_list(&folders);
    }

    uint32_t read(const char *xml, uint64_t length)
    {
        return simple_extract_folders_content(xml, length, folders, &folder_count, files,
                                              &file_count);
    }
    uint32_t read(const std::string &xml) { return read(xml.data(), xml.size()); }

    log_capture log;
    file_list *files = file_info_list_new();
    folder_list *folders = folder_info_list_new();
    int32_t file_count = untouched_number;
    int32_t folder_count = untouched_number;
};

TEST_F(FolderContent, ListsFoldersAndFilesInReverse)
{
    EXPECT_EQ(read("<response><folder_content>"
                   "<folders><folder><folderkey>d1</folderkey></folder>"
                   "<folder><folderkey>d2</folderkey></folder></folders>"
                   "<files><file><quickkey>f1</quickkey></file><file><quickkey>f2</quickkey></file>"
                   "<file><quickkey>f3</quickkey></file></files></folder_content></response>"),
              0u);

    EXPECT_EQ(folder_count, 2);
    EXPECT_EQ(file_count, 3);
    EXPECT_EQ(descriptions_of(folders), (texts{"folderkey=d2", "folderkey=d1"}));
    EXPECT_EQ(descriptions_of(files), (texts{"quickkey=f3", "quickkey=f2", "quickkey=f1"}));
    EXPECT_EQ(log.text(), "xml extract: folder size: 2, file size: 3\n");
}

TEST_F(FolderContent, TakesNineteenElementsOfAFolder)
{
    read("<r><folder><folderkey>01</folderkey><name>02</name><created>03</created>"
         "<description>04</description><tags>05</tags><folder_count>06</folder_count>"
         "<file_count>07</file_count><revision>08</revision><epoch>09</epoch><shared>10</shared>"
         "<owner_name>11</owner_name><delete_date>12</delete_date><custom_url>13</custom_url>"
         "<dropbox_enabled>14</dropbox_enabled><flag>15</flag>"
         "<shared_by_user>16</shared_by_user><permissions>17</permissions><avatar>18</avatar>"
         "<privacy>19</privacy></folder></r>");

    EXPECT_EQ(descriptions_of(folders),
              texts{"folderkey=01 foldername=02 created=03 desc=04 tags=05 foldercount=06 "
                    "filecount=07 revision=08 epoch=09 shared=10 owner_name=11 delete_date=12 "
                    "custom_url=13 dbx_enabled=14 flag=15 shared_by_user=16 permissions=17 "
                    "avatar=18 privacy=19"});
}

TEST_F(FolderContent, TakesEighteenElementsOfAFile)
{
    read("<r><file><quickkey>01</quickkey><filename>02</filename><created>03</created>"
         "<downloads>04</downloads><desc>05</desc><tags>06</tags><size>07</size>"
         "<privacy>08</privacy><filetype>09</filetype><mimetype>10</mimetype><hash>11</hash>"
         "<delete_date>12</delete_date><password_protected>13</password_protected>"
         "<revision>14</revision><owner_name>15</owner_name><flag>16</flag>"
         "<shared_by_user>17</shared_by_user><permissions>18</permissions></file></r>");

    EXPECT_EQ(descriptions_of(files),
              texts{"quickkey=01 filename=02 created=03 downloads=04 desc=05 tags=06 size=07 "
                    "privacy=08 type=09 mimetype=10 hash=11 delete_date=12 password_protected=13 "
                    "revision=14 owner_name=15 flag=16 shared_by_user=17 permissions=18"});
}

TEST_F(FolderContent, PassesOverWhatAFolderDoesNotHaveHere)
{
    read("<r><folder><parent_folderkey>x</parent_folderkey><total_files>x</total_files>"
         "<total_folders>x</total_folders><total_size>x</total_size><byte_count>x</byte_count>"
         "<desc>x</desc><filename>x</filename><foldername>x</foldername><quickkey>x</quickkey>"
         "<dbx_enabled>x</dbx_enabled><unknown>x</unknown></folder></r>");

    EXPECT_EQ(descriptions_of(folders), texts{""});
}

TEST_F(FolderContent, PassesOverWhatAFileDoesNotHaveHere)
{
    read("<r><file><parent_folderkey>x</parent_folderkey><description>x</description>"
         "<name>x</name><folderkey>x</folderkey><type>x</type><epoch>x</epoch>"
         "<unknown>x</unknown></file></r>");

    EXPECT_EQ(descriptions_of(files), texts{""});
}

TEST_F(FolderContent, HasNullForAnEmptyElement)
{
    read("<r><file><quickkey>k</quickkey><tags></tags><desc/></file></r>");

    EXPECT_EQ(descriptions_of(files), texts{"quickkey=k"});
}

TEST_F(FolderContent, JoinsTheTextsOfAnElementThatOccursTwice)
{
    read("<r><file><tags>one</tags><desc>d</desc><tags>two</tags></file></r>");

    EXPECT_EQ(descriptions_of(files), texts{"desc=d tags=onetwo"});
}

TEST_F(FolderContent, JoinsThePiecesOfAText)
{
    read("<r><folder><name>a&amp;b&lt;c&#233;\nd<!-- no text --><![CDATA[<e>]]></name></folder>"
         "</r>");

    EXPECT_EQ(descriptions_of(folders), texts{"foldername=a&b<c\xc3\xa9\nd<e>"});
}

TEST_F(FolderContent, StartsEveryRecordsTextsAnew)
{
    read("<r><file><filename>the first &amp; longer name</filename></file>"
         "<file><filename>a</filename><filename>b</filename></file>"
         "<folder><name>the first &amp; longer name</name></folder>"
         "<folder><name>c</name><name>d</name></folder></r>");

    EXPECT_EQ(descriptions_of(files), (texts{"filename=ab", "filename=the first & longer name"}));
    EXPECT_EQ(descriptions_of(folders),
              (texts{"foldername=cd", "foldername=the first & longer name"}));
}

TEST_F(FolderContent, IgnoresTextThatStandsDirectlyInARecord)
{
    read("<r><folder>x<folderkey>k</folderkey>y<name>n</name>z</folder></r>");

    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=k foldername=n"});
}

TEST_F(FolderContent, EndsAnElementsTextAtAChild)
{
    read("<r><folder><name>before<b>inside</b>behind</name></folder></r>");

    EXPECT_EQ(descriptions_of(folders), texts{"foldername=before"});
}

TEST_F(FolderContent, TakesElementsAtAnyDepthInARecord)
{
    read("<r><folder><info><name>n</name></info></folder>"
         "<file><info><more><size>5</size></more></info></file></r>");

    EXPECT_EQ(descriptions_of(folders), texts{"foldername=n"});
    EXPECT_EQ(descriptions_of(files), texts{"size=5"});
}

TEST_F(FolderContent, IgnoresElementsOutsideRecords)
{
    read("<r><name>x</name><quickkey>x</quickkey><file><quickkey>k</quickkey></file>"
         "<quickkey>x</quickkey><folder><folderkey>d</folderkey></folder><name>x</name></r>");

    EXPECT_EQ(descriptions_of(files), texts{"quickkey=k"});
    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=d"});
}

TEST_F(FolderContent, TakesNamesExactly)
{
    read("<r><Folder/><FILE/><folders/><files/><folder2/><xfile/></r>");

    EXPECT_EQ(folder_count, 0);
    EXPECT_EQ(file_count, 0);
    EXPECT_EQ(log.text(), "xml extract: folder size: 0, file size: 0\n");
}

TEST_F(FolderContent, FindsRecordsAtAnyDepthAndAtTheRoot)
{
    read("<folder><folderkey>root</folderkey></folder>");
    read("<a><b><c><d><file><quickkey>deep</quickkey></file></d></c></b></a>");

    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=root"});
    EXPECT_EQ(descriptions_of(files), texts{"quickkey=deep"});
}

TEST_F(FolderContent, ListsARecordWithoutElements)
{
    read("<r><folder/><file></file></r>");

    EXPECT_EQ(descriptions_of(folders), texts{""});
    EXPECT_EQ(descriptions_of(files), texts{""});
}

TEST_F(FolderContent, ReplacesAFolderInsideWhichAnotherStarts)
{
    EXPECT_EQ(read("<r><folder><folderkey>outer</folderkey><tags>t</tags>"
                   "<folder><folderkey>inner</folderkey></folder>"
                   "<name>late</name></folder></r>"),
              0u);

    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=inner"});
}

TEST_F(FolderContent, ReplacesAFileInsideWhichAnotherStarts)
{
    read("<r><file><quickkey>outer</quickkey><file><quickkey>inner</quickkey></file>"
         "<tags>late</tags></file></r>");

    EXPECT_EQ(descriptions_of(files), texts{"quickkey=inner"});
}

TEST_F(FolderContent, CountsWhatItLists)
{
    read("<r><folder><folder/></folder><file><file/></file></r>");

    EXPECT_EQ(folder_count, 1);
    EXPECT_EQ(file_count, 1);
    EXPECT_EQ(log.text(), "xml extract: folder size: 1, file size: 1\n");
}

TEST_F(FolderContent, TakesNoMoreOfAFolderBehindAFileInIt)
{
    read("<r><folder><folderkey>d</folderkey><file><quickkey>f</quickkey></file>"
         "<name>late</name></folder></r>");

    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=d"});
    EXPECT_EQ(descriptions_of(files), texts{"quickkey=f"});
}

TEST_F(FolderContent, TakesNoMoreOfAFileBehindAFolderInIt)
{
    read("<r><file><quickkey>f</quickkey><folder><folderkey>d</folderkey></folder>"
         "<tags>late</tags></file></r>");

    EXPECT_EQ(descriptions_of(files), texts{"quickkey=f"});
    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=d"});
}

TEST_F(FolderContent, AddsToWhatTheListsHold)
{
    read("<r><file><quickkey>a</quickkey></file><folder><folderkey>c</folderkey></folder></r>");

    read("<r><file><quickkey>b</quickkey></file><folder><folderkey>d</folderkey></folder></r>");

    EXPECT_EQ(descriptions_of(files), (texts{"quickkey=b", "quickkey=a"}));
    EXPECT_EQ(descriptions_of(folders), (texts{"folderkey=d", "folderkey=c"}));
    EXPECT_EQ(file_count, 1);
    EXPECT_EQ(folder_count, 1);
}

TEST_F(FolderContent, TouchesNothingWithoutText)
{
    EXPECT_EQ(read(nullptr, 5), 0u);
    EXPECT_EQ(read("<r><file/></r>", 0), 0u);

    EXPECT_EQ(file_count, untouched_number);
    EXPECT_EQ(folder_count, untouched_number);
    EXPECT_EQ(files->next, nullptr);
    EXPECT_EQ(folders->next, nullptr);
    EXPECT_EQ(log.text(), "");
}

TEST_F(FolderContent, ReadsNoFurtherThanItsLength)
{
    std::string xml = "<r><file/></r>";

    EXPECT_EQ(read((xml + "trailing rubbish").c_str(), xml.size()), 0u);

    EXPECT_EQ(file_count, 1);
}

TEST_F(FolderContent, GoesByTheLow32BitsOfTheLength)
{
    std::string xml = "<r><file/></r>";

    EXPECT_EQ(read(xml.c_str(), xml.size() + (uint64_t{1} << 32)), 0u);

    EXPECT_EQ(file_count, 1);
}

TEST_F(FolderContent, KeepsWhatWasFinishedBeforeDamage)
{
    EXPECT_EQ(read("<r><folder><folderkey>d</folderkey></folder>"
                   "<file><quickkey>f</quickkey></file><file><quickkey>open</quickkey></r>"),
              1u);

    EXPECT_EQ(descriptions_of(folders), texts{"folderkey=d"});
    EXPECT_EQ(descriptions_of(files), texts{"quickkey=f"});
    EXPECT_EQ(folder_count, 1);
    EXPECT_EQ(file_count, 1);
    EXPECT_EQ(log.text(), "xml extract: folder size: 1, file size: 1\n");
}

TEST_F(FolderContent, ReportsWhatIsNoXml)
{
    EXPECT_EQ(read("no markup"), 1u);

    EXPECT_EQ(folder_count, 0);
    EXPECT_EQ(file_count, 0);
    EXPECT_EQ(log.text(), "xml extract: folder size: 0, file size: 0\n");
}

TEST_F(FolderContent, ReportsADocumentCutOffAnywhere)
{
    const std::string whole = "<r><folder><folderkey>d</folderkey><name>a&amp;b</name></folder>"
                              "<file><quickkey>f</quickkey><filename>n</filename></file>"
                              "<folder><folderkey>e</folderkey></folder></r>";

    for (size_t length = 1; length < whole.size(); ++length) {
        std::string part = whole.substr(0, length);
        EXPECT_EQ(read(part), 1u) << part;
        EXPECT_EQ(folder_count, occurrences("</folder>", part)) << part;
        EXPECT_EQ(file_count, occurrences("</file>", part)) << part;
    }
}

TEST_F(FolderContent, ReadsAHundredThousandEntries)
{
    constexpr int32_t many = 100000;
    std::string xml = "<r>";
    for (int32_t index = 0; index < many; ++index) {
        std::string number = std::to_string(index);
        xml += "<folder><folderkey>" + number + "</folderkey></folder>";
        xml += "<file><quickkey>" + number + "</quickkey></file>";
    }

    EXPECT_EQ(read(xml + "</r>"), 0u);

    EXPECT_EQ(folder_count, many);
    EXPECT_EQ(file_count, many);
    EXPECT_STREQ(folder_info_get_folderkey(folders->next->record), "99999");
    EXPECT_EQ(descriptions_of(files).back(), "quickkey=0");
}

TEST(FolderContentState, HasThePublicLayout)
{
    EXPECT_EQ(offsetof(folder_content_state, current_file), 0u);
    EXPECT_EQ(offsetof(folder_content_state, current_folder), 8u);
    EXPECT_EQ(offsetof(folder_content_state, files), 16u);
    EXPECT_EQ(offsetof(folder_content_state, folders), 24u);
    EXPECT_EQ(offsetof(folder_content_state, mode), 32u);
    EXPECT_EQ(offsetof(folder_content_state, current_element), 40u);
    EXPECT_EQ(offsetof(folder_content_state, file_count), 48u);
    EXPECT_EQ(offsetof(folder_content_state, folder_count), 52u);
    EXPECT_EQ(sizeof(folder_content_state), 56u);
}

// The callbacks with a state of the test's own, as a parser would call them.
class FolderContentCallbacks : public testing::Test {
protected:
    FolderContentCallbacks()
    {
        state.files = file_info_list_new();
        state.folders = folder_info_list_new();
    }
    ~FolderContentCallbacks() override
    {
        api_free(state.current_element);
        file_info_delete(&state.current_file);
        folder_info_delete(&state.current_folder);
        delete_all_file_list(&state.files);
        delete_all_folder_list(&state.folders);
    }

    void start(const char *element)
    {
        simple_extract_folders_node_value_start(&state, element, nullptr);
    }
    void end(const char *element) { simple_extract_folders_node_value_end(&state, element); }
    void data(const std::string &text)
    {
        simple_extract_folders_node_value_data(&state, text.data(),
                                               static_cast<int32_t>(text.size()));
    }

    folder_content_state state = {};
};

TEST_F(FolderContentCallbacks, OpenAFolder)
{
    start("folder");

    EXPECT_EQ(state.mode, 1);
    EXPECT_EQ(description_of(state.current_folder), "");
    EXPECT_EQ(state.current_file, nullptr);
    EXPECT_STREQ(state.current_element, "folder");
    EXPECT_EQ(state.folder_count, 0);
}

TEST_F(FolderContentCallbacks, OpenAFile)
{
    start("file");

    EXPECT_EQ(state.mode, 2);
    EXPECT_EQ(description_of(state.current_file), "");
    EXPECT_EQ(state.current_folder, nullptr);
    EXPECT_STREQ(state.current_element, "file");
    EXPECT_EQ(state.file_count, 0);
}

TEST_F(FolderContentCallbacks, RememberTheElementThatStartedLast)
{
    start("response");
    start("name");

    EXPECT_STREQ(state.current_element, "name");
    EXPECT_EQ(state.mode, 0);
}

TEST_F(FolderContentCallbacks, ForgetTheElementAtAnyEnd)
{
    start("folder");
    start("name");

    end("name");

    EXPECT_EQ(state.current_element, nullptr);
    EXPECT_EQ(state.mode, 1);
}

TEST_F(FolderContentCallbacks, AppendPiecesOfText)
{
    start("folder");
    start("name");
    data("pie");
    data("ces");

    EXPECT_EQ(description_of(state.current_folder), "foldername=pieces");
}

TEST_F(FolderContentCallbacks, AppendToATextThatTheCallerPutThere)
{
    state.current_file = file_info_new(
        "early", nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
        nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
    state.mode = 2;
    state.current_element = string_dup("quickkey");

    data("+late");

    EXPECT_EQ(description_of(state.current_file), "quickkey=early+late");
}

TEST_F(FolderContentCallbacks, ListAFinishedFolder)
{
    start("folder");
    folder_info *folder = state.current_folder;

    end("folder");

    ASSERT_NE(state.folders->next, nullptr);
    EXPECT_EQ(state.folders->next->record, folder);
    EXPECT_EQ(state.current_folder, nullptr);
    EXPECT_EQ(state.mode, 0);
    EXPECT_EQ(state.folder_count, 1);
    EXPECT_EQ(state.current_element, nullptr);
}

TEST_F(FolderContentCallbacks, ListAFinishedFile)
{
    start("file");
    file_info *file = state.current_file;

    end("file");

    ASSERT_NE(state.files->next, nullptr);
    EXPECT_EQ(state.files->next->record, file);
    EXPECT_EQ(state.current_file, nullptr);
    EXPECT_EQ(state.mode, 0);
    EXPECT_EQ(state.file_count, 1);
}

TEST_F(FolderContentCallbacks, TakeTextOnlyWhereModeAndRecordAgree)
{
    state.current_element = string_dup("tags");
    data("outside");
    state.mode = 1;
    data("no folder");
    state.mode = 2;
    data("no file");
    start("folder");
    end("response");

    data("no element");

    EXPECT_EQ(description_of(state.current_folder), "");
    EXPECT_EQ(state.current_file, nullptr);
}

} // namespace
} // namespace quillmere_test
