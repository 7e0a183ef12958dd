// What the listing of a folder and the operations on foreign folders send and read.
#include <string>

#include "api/account_call_test.h"

namespace quillmere_test {
namespace {

class ContentRequest : public account_call_test,
                       public testing::WithParamInterface<request_case> {};

TEST_P(ContentRequest, IsComposedInOrder)
{
    EXPECT_EQ(target_of(GetParam().call), GetParam().target);
}

const std::string content = "/api/1.0/folder/get_content.php";
const std::string attach = "/api/folder/attach_foreign.php";
const std::string detach = "/api/folder/detach_foreign.php";

const request_case folder_content_requests[] = {
    {"special", [] { return folder_content_call(special, special, special, special, special); },
     content + "?session_token=" + plain + "&folder_key=" + plain + "&device_id=" + plain +
         "&chunk=" + plain + "&content_type=" + plain + "&version=2"},
    {"empty", [] { return folder_content_call("", "", "", "", ""); },
     content + "?session_token=&folder_key=&device_id=&chunk=&content_type=&version=2"},
    {"token", [] { return folder_content_call("t", nullptr, nullptr, nullptr, nullptr); },
     content + "?session_token=t&version=2"},
    {"key", [] { return folder_content_call(nullptr, "k", nullptr, nullptr, nullptr); },
     content + "?folder_key=k&version=2"},
    {"token_and_key", [] { return folder_content_call("t", "k", nullptr, nullptr, nullptr); },
     content + "?session_token=t&folder_key=k&version=2"},
    {"device", [] { return folder_content_call(nullptr, nullptr, "d", nullptr, nullptr); },
     content + "&device_id=d&version=2"},
    {"chunk", [] { return folder_content_call(nullptr, nullptr, nullptr, "3", nullptr); },
     content + "&chunk=3&version=2"},
    {"type", [] { return folder_content_call(nullptr, nullptr, nullptr, nullptr, "files"); },
     content + "&content_type=files&version=2"},
    {"nothing", [] { return folder_content_call(nullptr, nullptr, nullptr, nullptr, nullptr); },
     content + "&version=2"},

    {"attach_special", [] { return attach_foreign_call(special, special); },
     attach + "?session_token=" + plain + "&folder_key=" + plain + "&version=2"},
    {"attach_empty", [] { return attach_foreign_call("", ""); },
     attach + "?session_token=&folder_key=&version=2"},
    {"attach_nothing", [] { return attach_foreign_call(nullptr, nullptr); },
     attach + "?session_token=&folder_key=&version=2"},
    {"detach_special", [] { return detach_foreign_call(special, special); },
     detach + "?session_token=" + plain + "&folder_key=" + plain + "&version=2"},
    {"detach_empty", [] { return detach_foreign_call("", ""); },
     detach + "?session_token=&folder_key=&version=2"},
    {"detach_nothing", [] { return detach_foreign_call(nullptr, nullptr); },
     detach + "?session_token=&folder_key=&version=2"},
};
INSTANTIATE_TEST_SUITE_P(Api, ContentRequest, testing::ValuesIn(folder_content_requests),
                         name_of_case);

class GetFolderContent : public account_call_test {
protected:
    call_outcome reading(const std::string &elements)
    {
        return with_elements(elements,
                             [] { return folder_content_call("t", "k", nullptr, "1", nullptr); });
    }
};

constexpr const char *folders = "<folder><folderkey>d1</folderkey></folder>"
                                "<folder><folderkey>d2</folderkey></folder>";
constexpr const char *files = "<file><quickkey>f1</quickkey></file>"
                              "<file><quickkey>f2</quickkey></file>"
                              "<file><quickkey>f3</quickkey></file>";

TEST_F(GetFolderContent, ListsAChunkInReverse)
{
    EXPECT_EQ(reading(std::string("<folder_content><chunk_size>50</chunk_size><folders>") +
                      folders + "</folders><files>" + files + "</files></folder_content>"),
              accepted("folders=2 files=3 chunk=50 folders{folderkey=d2}{folderkey=d1} "
                       "files{quickkey=f3}{quickkey=f2}{quickkey=f1}"));
}

TEST_F(GetFolderContent, HasNoListWhereThereIsNothingToList)
{
    EXPECT_EQ(reading(folders), accepted("folders=2 files=0 chunk=100 "
                                         "folders{folderkey=d2}{folderkey=d1} files=NULL"));
    EXPECT_EQ(reading(files), accepted("folders=0 files=3 chunk=100 folders=NULL "
                                       "files{quickkey=f3}{quickkey=f2}{quickkey=f1}"));
    EXPECT_EQ(reading("<folders/><files/>"),
              accepted("folders=0 files=0 chunk=100 folders=NULL files=NULL"));
}

TEST_F(GetFolderContent, HasAChunkSizeOfAHundredUnlessToldOtherwise)
{
    auto chunk_of = [this](const std::string &elements) {
        std::string results = reading(elements).results;
        size_t start = results.find("chunk=") + 6;
        return results.substr(start, results.find(' ', start) - start);
    };

    EXPECT_EQ(chunk_of(""), "100");
    EXPECT_EQ(chunk_of("<chunk_size/>"), "100");
    EXPECT_EQ(chunk_of("<chunk_size>1000</chunk_size>"), "1000");
    EXPECT_EQ(chunk_of("<chunk_size>0</chunk_size>"), "0");
    EXPECT_EQ(chunk_of("<chunk_size>-3</chunk_size>"), "-3");
    EXPECT_EQ(chunk_of("<chunk_size>abc</chunk_size>"), "0");
}

TEST_F(GetFolderContent, LogsTheReadingOfAnEmptyFolder)
{
    reading("");

    std::string lines = log.text();
    std::string last = "xml extract: folder size: 0, file size: 0\nget_folder_content Success\n";
    ASSERT_GE(lines.size(), last.size());
    EXPECT_EQ(lines.substr(lines.size() - last.size()), last);
}

TEST_F(GetFolderContent, KeepsTheNumbersOfADamagedListing)
{
    server.answer(xml_reply("<response><result>Success</result><chunk_size>9</chunk_size>" +
                            std::string(folders) + "<file>"));
    hook_recorder hook;

    EXPECT_EQ(folder_content_call("t", "k", nullptr, "1", nullptr),
              (call_outcome{QM_MALFORMED_REPLY, std::nullopt,
                            "folders=2 files=0 chunk=9 folders=NULL files=NULL"}));
    EXPECT_TRUE(hook.calls().empty());
}

TEST_F(GetFolderContent, ListsAHundredThousandEntries)
{
    constexpr int32_t many = 100000;
    std::string listing;
    for (int32_t index = 0; index < many; ++index)
        listing += "<file><quickkey>" + std::to_string(index) + "</quickkey></file>";
    server.answer(xml_reply(accepted_reply(listing)));
    char *message = nullptr;
    folder_list *no_folders = nullptr;
    file_list *all = nullptr;
    int32_t folder_count = 0;
    int32_t file_count = 0;
    int32_t chunk_size = 0;

    EXPECT_EQ(get_folder_content("t", "k", nullptr, "1", nullptr, &message, &no_folders,
                                 &folder_count, &all, &file_count, &chunk_size),
              QM_OK);

    EXPECT_EQ(file_count, many);
    ASSERT_NE(all, nullptr);
    int32_t expected = many;
    for (const file_list *node = all->next; node; node = node->next)
        if (std::to_string(--expected) != file_info_get_quickkey(node->record))
            ADD_FAILURE() << "not " << expected;
    EXPECT_EQ(expected, 0);
    delete_all_file_list(&all);
}

} // namespace
} // namespace quillmere_test
