// What the operations on one folder send, and what they read from their replies.
#include <string>

#include "api/account_call_test.h"

namespace quillmere_test {
namespace {

class FolderRequest : public account_call_test, public testing::WithParamInterface<request_case> {};

TEST_P(FolderRequest, IsComposedInOrder)
{
    EXPECT_EQ(target_of(GetParam().call), GetParam().target);
}

const request_case folder_info_requests[] = {
    {"nothing", [] { return folder_info_call(nullptr, nullptr, nullptr, nullptr); },
     "/api/folder/get_info.php?details=yes&version=2"},
    {"empty", [] { return folder_info_call("", "", "", ""); },
     "/api/folder/get_info.php?session_token=&device_id=&folder_key=&details=yes&version=2"},
    {"special", [] { return folder_info_call(special, special, special, special); },
     "/api/folder/get_info.php?session_token=" + plain + "&device_id=" + plain +
         "&folder_key=" + plain + "&details=" + plain + "&version=2"},
    {"token", [] { return folder_info_call("t", nullptr, nullptr, nullptr); },
     "/api/folder/get_info.php?session_token=t&details=yes&version=2"},
    {"key", [] { return folder_info_call(nullptr, "k", nullptr, nullptr); },
     "/api/folder/get_info.php?folder_key=k&details=yes&version=2"},
    {"device", [] { return folder_info_call(nullptr, nullptr, "d", nullptr); },
     "/api/folder/get_info.php?device_id=d&details=yes&version=2"},
    {"details", [] { return folder_info_call(nullptr, nullptr, nullptr, "no"); },
     "/api/folder/get_info.php?details=no&version=2"},
};
INSTANTIATE_TEST_SUITE_P(GetFolderInfo, FolderRequest, testing::ValuesIn(folder_info_requests),
                         name_of_case);

const request_case folder_create_requests[] = {
    {"name_alone", [] { return create_folder_call("t", "n", nullptr, nullptr); },
     "/api/folder/create.php?session_token=t&foldername=n&allow_duplicate_name=no&version=2"},
    {"no_name", [] { return create_folder_call("t", nullptr, nullptr, nullptr); },
     "/api/folder/create.php?session_token=t&foldername=&allow_duplicate_name=no&version=2"},
    {"no_token", [] { return create_folder_call(nullptr, "n", nullptr, nullptr); },
     "/api/folder/create.php?session_token=&foldername=n&allow_duplicate_name=no&version=2"},
    {"empty", [] { return create_folder_call("", "", "", ""); },
     "/api/folder/create.php?session_token=&foldername=&allow_duplicate_name=no&version=2"},
    {"parent", [] { return create_folder_call("t", "n", "p", nullptr); },
     "/api/folder/create.php?session_token=t&foldername=n&parent_key=p&allow_duplicate_name=no"
     "&version=2"},
    {"time", [] { return create_folder_call("t", "n", nullptr, "m"); },
     "/api/folder/create.php?session_token=t&foldername=n&mtime=m&allow_duplicate_name=no"
     "&version=2"},
    {"special",
     [] { return create_folder_call(special, every_byte(), every_byte(), every_byte()); },
     "/api/folder/create.php?session_token=" + plain + "&foldername=" + encoded +
         "&parent_key=" + encoded + "&mtime=" + encoded + "&allow_duplicate_name=no&version=2"},
};
INSTANTIATE_TEST_SUITE_P(CreateFolder, FolderRequest, testing::ValuesIn(folder_create_requests),
                         name_of_case);

const request_case folder_delete_requests[] = {
    {"special", [] { return delete_folder_call(special, every_byte()); },
     "/api/folder/delete.php?session_token=" + plain + "&folder_key=" + encoded + "&version=2"},
    {"empty", [] { return delete_folder_call("", ""); },
     "/api/folder/delete.php?session_token=&folder_key=&version=2"},
    {"nothing", [] { return delete_folder_call(nullptr, nullptr); },
     "/api/folder/delete.php?session_token=&folder_key=&version=2"},
};
INSTANTIATE_TEST_SUITE_P(DeleteFolder, FolderRequest, testing::ValuesIn(folder_delete_requests),
                         name_of_case);

call_outcome changed_privacy(int32_t privacy, int32_t recursive)
{
    return update_folder_call("t", "k", nullptr, nullptr, nullptr, privacy, recursive, nullptr);
}

const std::string update_target = "/api/folder/update.php?session_token=t&folder_key=k&version=2";

const request_case update_requests[] = {
    {"nothing", [] { return changed_privacy(0, 0); }, update_target},
    {"empty", [] { return update_folder_call("", "", "", "", "", 0, 0, ""); },
     "/api/folder/update.php?session_token=&folder_key=&version=2&description=&tags="},
    {"no_folder",
     [] { return update_folder_call(nullptr, nullptr, nullptr, nullptr, nullptr, 0, 0, nullptr); },
     "/api/folder/update.php?session_token=&folder_key=&version=2"},
    {"name", [] { return update_folder_call("t", "k", "n", nullptr, nullptr, 0, 0, nullptr); },
     update_target + "&foldername=n"},
    {"description",
     [] { return update_folder_call("t", "k", nullptr, "d e", nullptr, 0, 0, nullptr); },
     update_target + "&description=d%20e"},
    {"tags", [] { return update_folder_call("t", "k", nullptr, nullptr, "g", 0, 0, nullptr); },
     update_target + "&tags=g"},
    {"time", [] { return update_folder_call("t", "k", nullptr, nullptr, nullptr, 0, 0, "m"); },
     update_target + "&mtime=m"},
    {"special",
     [] {
         const char *every = every_byte();
         return update_folder_call(special, every, every, every, every, -1, 1, every);
     },
     "/api/folder/update.php?session_token=" + plain + "&folder_key=" + encoded +
         "&version=2&foldername=" + encoded + "&description=" + encoded + "&tags=" + encoded +
         "&privacy=public&privacy_recursive=yes&mtime=" + encoded},
    {"public", [] { return changed_privacy(-1, 0); },
     update_target + "&privacy=public&privacy_recursive=no"},
    {"public_below", [] { return changed_privacy(-1, 1); },
     update_target + "&privacy=public&privacy_recursive=yes"},
    {"private", [] { return changed_privacy(1, 0); },
     update_target + "&privacy=private&privacy_recursive=no"},
    {"private_below", [] { return changed_privacy(1, 2); },
     update_target + "&privacy=private&privacy_recursive=yes"},
    {"private_below_negative", [] { return changed_privacy(1, -1); },
     update_target + "&privacy=private&privacy_recursive=yes"},
    {"unchanged_below", [] { return changed_privacy(0, 1); }, update_target},
    {"no_privacy", [] { return changed_privacy(2, 1); }, update_target},
    {"no_negative_privacy", [] { return changed_privacy(-2, 1); }, update_target},
};
INSTANTIATE_TEST_SUITE_P(UpdateFolder, FolderRequest, testing::ValuesIn(update_requests),
                         name_of_case);

const request_case folder_transfer_requests[] = {
    {"copy_special", [] { return copy_folder_call(special, special, special); },
     "/api/folder/copy.php?session_token=" + plain + "&folder_key_src=" + plain +
         "&folder_key_dst=" + plain + "&version=2"},
    {"copy_nowhere", [] { return copy_folder_call("t", "s", nullptr); },
     "/api/folder/copy.php?session_token=t&folder_key_src=s&version=2"},
    {"copy_empty", [] { return copy_folder_call("", "", ""); },
     "/api/folder/copy.php?session_token=&folder_key_src=&folder_key_dst=&version=2"},
    {"copy_nothing", [] { return copy_folder_call(nullptr, nullptr, nullptr); },
     "/api/folder/copy.php?session_token=&folder_key_src=&version=2"},
    {"move_special", [] { return move_folder_call(special, special, special); },
     "/api/folder/move.php?session_token=" + plain + "&folder_key_src=" + plain +
         "&folder_key_dst=" + plain + "&version=2"},
    {"move_nowhere", [] { return move_folder_call("t", "s", nullptr); },
     "/api/folder/move.php?session_token=t&folder_key_src=s&version=2"},
    {"move_empty", [] { return move_folder_call("", "", ""); },
     "/api/folder/move.php?session_token=&folder_key_src=&folder_key_dst=&version=2"},
    {"move_nothing", [] { return move_folder_call(nullptr, nullptr, nullptr); },
     "/api/folder/move.php?session_token=&folder_key_src=&version=2"},
};
INSTANTIATE_TEST_SUITE_P(CopyAndMoveFolder, FolderRequest,
                         testing::ValuesIn(folder_transfer_requests), name_of_case);

class FolderReply : public account_call_test {};

constexpr const char *folder_elements =
    "<folderkey>01</folderkey><name>02</name><created>03</created>"
    "<description>04</description><tags>05</tags><folder_count>06</folder_count>"
    "<file_count>07</file_count><total_files>08</total_files>"
    "<total_folders>09</total_folders><total_size>10</total_size><revision>11</revision>"
    "<epoch>12</epoch><shared>13</shared><owner_name>14</owner_name>"
    "<parent_folderkey>15</parent_folderkey><delete_date>16</delete_date>"
    "<custom_url>17</custom_url><dropbox_enabled>18</dropbox_enabled><flag>19</flag>"
    "<shared_by_user>20</shared_by_user><permissions>21</permissions><avatar>22</avatar>"
    "<privacy>23</privacy><byte_count>24</byte_count>";

TEST_F(FolderReply, HasTwentyFourElements)
{
    EXPECT_EQ(with_elements("<folder_info>" + std::string(folder_elements) + "</folder_info>",
                            [] { return folder_info_call("t", "k", nullptr, nullptr); }),
              accepted("record{folderkey=01 foldername=02 created=03 desc=04 tags=05 "
                       "foldercount=06 filecount=07 total_files=08 total_folders=09 "
                       "total_size=10 revision=11 epoch=12 shared=13 owner_name=14 "
                       "parent_folderkey=15 delete_date=16 custom_url=17 dbx_enabled=18 flag=19 "
                       "shared_by_user=20 permissions=21 avatar=22 privacy=23 byte_count=24}"));
}

TEST_F(FolderReply, FindsElementsInTheirPlaceAlone)
{
    EXPECT_EQ(with_elements(std::string(folder_elements) + "<folder_info><inner>" +
                                folder_elements + "</inner></folder_info>",
                            [] { return folder_info_call("t", "k", nullptr, nullptr); }),
              accepted("record{}"));
}

TEST_F(FolderReply, MayLackTheKeyOfANewFolder)
{
    EXPECT_EQ(with_elements("<new_folderkey>no</new_folderkey>",
                            [] { return create_folder_call("t", "n", nullptr, nullptr); }),
              accepted("key=NULL"));
}

TEST_F(FolderReply, MayLackTheKeyOfACopy)
{
    EXPECT_EQ(with_elements("<folder_key>no</folder_key>",
                            [] { return copy_folder_call("t", "s", "d"); }),
              accepted("key=NULL"));
}

TEST_F(FolderReply, HasTheNewKeyAtAnyDepth)
{
    EXPECT_EQ(with_elements("<in><folder_key>k&amp;l</folder_key></in>",
                            [] { return create_folder_call("t", "n", nullptr, nullptr); }),
              accepted("key=k&l"));
    EXPECT_EQ(with_elements("<in><new_folderkey>m</new_folderkey></in>",
                            [] { return copy_folder_call("t", "s", "d"); }),
              accepted("key=m"));
}

} // namespace
} // namespace quillmere_test
