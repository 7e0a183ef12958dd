// What the operations on one file send, and what they read from their replies.
#include <string>

#include "api/account_call_test.h"

namespace quillmere_test {
namespace {

class FileRequest : public account_call_test, public testing::WithParamInterface<request_case> {};

TEST_P(FileRequest, IsComposedInOrder) { EXPECT_EQ(target_of(GetParam().call), GetParam().target); }

const request_case file_info_requests[] = {
    {"special", [] { return file_info_call(special, special); },
     "/api/file/get_info.php?quick_key=" + plain + "&session_token=" + plain + "&version=2"},
    {"no_token", [] { return file_info_call("q", nullptr); },
     "/api/file/get_info.php?quick_key=q&version=2"},
    {"empty", [] { return file_info_call("", ""); },
     "/api/file/get_info.php?quick_key=&session_token=&version=2"},
    {"nothing", [] { return file_info_call(nullptr, nullptr); },
     "/api/file/get_info.php?quick_key=&version=2"},
};
INSTANTIATE_TEST_SUITE_P(GetFileInfo, FileRequest, testing::ValuesIn(file_info_requests),
                         name_of_case);

const request_case file_create_requests[] = {
    {"nothing", [] { return create_file_call("t", nullptr, nullptr, nullptr, nullptr); },
     "/api/file/create.php?session_token=t&version=2"},
    {"no_token", [] { return create_file_call(nullptr, nullptr, nullptr, nullptr, nullptr); },
     "/api/file/create.php?session_token=&version=2"},
    {"empty", [] { return create_file_call("", "", "", "", ""); },
     "/api/file/create.php?session_token=&filename=&file_extension=&parent_key=&version=2"},
    {"special",
     [] {
         const char *every = every_byte();
         return create_file_call(special, every, every, every, every);
     },
     "/api/file/create.php?session_token=" + plain + "&filename=" + encoded + "&file_extension=" +
         encoded + "&parent_key=" + encoded + "&mtime=" + encoded + "&version=2"},
    {"name", [] { return create_file_call("t", "n", nullptr, nullptr, nullptr); },
     "/api/file/create.php?session_token=t&filename=n&version=2"},
    {"extension", [] { return create_file_call("t", nullptr, "e", nullptr, nullptr); },
     "/api/file/create.php?session_token=t&file_extension=e&version=2"},
    {"parent", [] { return create_file_call("t", nullptr, nullptr, "p", nullptr); },
     "/api/file/create.php?session_token=t&parent_key=p&version=2"},
    {"time", [] { return create_file_call("t", nullptr, nullptr, nullptr, "m"); },
     "/api/file/create.php?session_token=t&mtime=m&version=2"},
};
INSTANTIATE_TEST_SUITE_P(CreateFile, FileRequest, testing::ValuesIn(file_create_requests),
                         name_of_case);

const request_case file_delete_requests[] = {
    {"special", [] { return delete_file_call(special, special); },
     "/api/file/delete.php?session_token=" + plain + "&quick_key=" + plain + "&version=2"},
    {"empty", [] { return delete_file_call("", ""); },
     "/api/file/delete.php?session_token=&quick_key=&version=2"},
    {"nothing", [] { return delete_file_call(nullptr, nullptr); },
     "/api/file/delete.php?session_token=&quick_key=&version=2"},
};
INSTANTIATE_TEST_SUITE_P(DeleteFile, FileRequest, testing::ValuesIn(file_delete_requests),
                         name_of_case);

const request_case file_transfer_requests[] = {
    {"copy_special", [] { return copy_file_call(special, special, every_byte()); },
     "/api/file/copy.php?session_token=" + plain + "&quick_key=" + plain +
         "&folder_key=" + encoded + "&version=2"},
    {"copy_nowhere", [] { return copy_file_call("t", "q", nullptr); },
     "/api/file/copy.php?session_token=t&quick_key=q&version=2"},
    {"copy_empty", [] { return copy_file_call("", "", ""); },
     "/api/file/copy.php?session_token=&quick_key=&folder_key=&version=2"},
    {"copy_nothing", [] { return copy_file_call(nullptr, nullptr, nullptr); },
     "/api/file/copy.php?session_token=&quick_key=&version=2"},
    {"move_special", [] { return move_file_call(special, special, every_byte()); },
     "/api/file/move.php?session_token=" + plain + "&quick_key=" + plain +
         "&folder_key=" + encoded + "&version=2"},
    {"move_nowhere", [] { return move_file_call("t", "q", nullptr); },
     "/api/file/move.php?session_token=t&quick_key=q&version=2"},
    {"move_empty", [] { return move_file_call("", "", ""); },
     "/api/file/move.php?session_token=&quick_key=&folder_key=&version=2"},
    {"move_nothing", [] { return move_file_call(nullptr, nullptr, nullptr); },
     "/api/file/move.php?session_token=&quick_key=&version=2"},
};
INSTANTIATE_TEST_SUITE_P(CopyAndMoveFile, FileRequest, testing::ValuesIn(file_transfer_requests),
                         name_of_case);

class FileReply : public account_call_test {};

constexpr const char *file_elements =
    "<quickkey>01</quickkey><parent_folderkey>02</parent_folderkey><filename>03</filename>"
    "<created>04</created><downloads>05</downloads><description>06</description>"
    "<tags>07</tags><size>08</size><privacy>09</privacy><filetype>10</filetype>"
    "<mimetype>11</mimetype><hash>12</hash><delete_date>13</delete_date>"
    "<password_protected>14</password_protected><revision>15</revision>"
    "<owner_name>16</owner_name><flag>17</flag><shared_by_user>18</shared_by_user>"
    "<permissions>19</permissions>";

TEST_F(FileReply, HasNineteenElements)
{
    EXPECT_EQ(with_elements("<file_info>" + std::string(file_elements) + "</file_info>",
                            [] { return file_info_call("q", "t"); }),
              accepted("record{quickkey=01 parent_folderkey=02 filename=03 created=04 "
                       "downloads=05 desc=06 tags=07 size=08 privacy=09 type=10 mimetype=11 "
                       "hash=12 delete_date=13 password_protected=14 revision=15 owner_name=16 "
                       "flag=17 shared_by_user=18 permissions=19}"));
}

TEST_F(FileReply, FindsElementsInTheirPlaceAlone)
{
    EXPECT_EQ(with_elements(std::string(file_elements) + "<file_info><inner>" + file_elements +
                                "</inner></file_info>",
                            [] { return file_info_call("q", "t"); }),
              accepted("record{}"));
}

TEST_F(FileReply, MayLackTheKeyOfANewFile)
{
    EXPECT_EQ(with_elements("<new_quickkey>no</new_quickkey>",
                            [] { return create_file_call("t", "n", nullptr, nullptr, nullptr); }),
              accepted("key=NULL"));
}

TEST_F(FileReply, MayLackTheKeyOfACopy)
{
    EXPECT_EQ(
        with_elements("<quickkey>no</quickkey>", [] { return copy_file_call("t", "q", "k"); }),
        accepted("key=NULL"));
}

TEST_F(FileReply, HasTheNewKeyAtAnyDepth)
{
    EXPECT_EQ(with_elements("<in><quickkey>k&amp;l</quickkey></in>",
                            [] { return create_file_call("t", "n", nullptr, nullptr, nullptr); }),
              accepted("key=k&l"));
    EXPECT_EQ(with_elements("<in><new_quickkey>m</new_quickkey></in>",
                            [] { return copy_file_call("t", "q", "k"); }),
              accepted("key=m"));
}

} // namespace
} // namespace quillmere_test
