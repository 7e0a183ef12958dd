#include "api/account_operations.h"

namespace quillmere_test {

std::string accepted_reply(const std::string &elements)
{
    return "<?xml version=\"1.0\"?><response><result>Success</result>" + elements + "</response>";
}

std::string refusing_reply(const std::string &elements)
{
    return "<response><result>Error</result>" + elements + "</response>";
}

std::string account_operation::accepted_reply() const
{
    return quillmere_test::accepted_reply(elements);
}

std::string account_operation::log_of(const std::string &base, const std::string &reply) const
{
    std::string log = entry_line;
    if (url_heading)
        log += url_heading + base + target() + "\n";
    if (reply_heading)
        log += reply_heading + (reply.empty() ? "(null)" : reply) + "\n";
    if (logs_length)
        log += "Text len: " + std::to_string(reply.size()) + "\n";
    return log;
}

// One argument or element to a line would make a table of three hundred lines.
// clang-format off
const account_operation account_operations[20] = {
    {"get_user_info", &get_user_info_uri, "/api/user/get_info.php",
     "?session_token=token&version=2",
     "", "get user  url: ", "Got text:\n", false, error_reading::standard, true,
     "<user_info><email>e@x</email></user_info>", "", "record{email=e@x}", "record=NULL",
     [] { return user_info_call("token"); }},
    {"get_user_limits", &get_user_limits_uri, "/api/user/get_limits.php",
     "?session_token=token&version=2",
     "", "get user limits url: ", "Got text:\n", false, error_reading::standard, true,
     "<storage_used>5</storage_used>", "", "record{storage_used=5}", "record=NULL",
     [] { return user_limits_call("token"); }},
    {"get_myfiles_revision", &myfiles_revision_uri, "/api/user/myfiles_revision.php",
     "?session_token=token&version=2",
     "", nullptr, nullptr, false, error_reading::standard, false,
     "<revision>12</revision><epoch>34</epoch>", "", "revision=12 epoch=34",
     "revision=NULL epoch=NULL",
     [] { return myfiles_revision_call("token"); }},

    {"get_folder_info", &get_folder_info_uri, "/api/folder/get_info.php",
     "?session_token=token&device_id=dev&folder_key=key&details=det&version=2",
     "", "\nget_folder_info url text:\n", "Got text:\n", true, error_reading::direct, true,
     "<folder_info><name>n</name></folder_info>", "", "record{foldername=n}", "record=NULL",
     [] { return folder_info_call("token", "key", "dev", "det"); }},
    {"create_folder", &create_folder_uri, "/api/folder/create.php",
     "?session_token=token&foldername=n&parent_key=p&mtime=t&allow_duplicate_name=no&version=2",
     "", "create_folder: url: ", "Got response:\n", false, error_reading::standard, true,
     "<folder_key>new</folder_key>", "", "key=new", "key=NULL",
     [] { return create_folder_call("token", "n", "p", "t"); }},
    {"delete_folder", &delete_folder_uri, "/api/folder/delete.php",
     "?session_token=token&folder_key=key&version=2",
     "", "delete_folder url: ", "Got text:\n", false, error_reading::standard, true,
     "", "", "", "",
     [] { return delete_folder_call("token", "key"); }},
    {"update_folder", &update_folder_uri, "/api/folder/update.php",
     "?session_token=token&folder_key=key&version=2&foldername=n&description=d&tags=g"
     "&privacy=private&privacy_recursive=no&mtime=t",
     "", "update folder url: ", "Got text:\n", false, error_reading::standard, true,
     "", "", "", "",
     [] { return update_folder_call("token", "key", "n", "d", "g", 1, 0, "t"); }},
    {"copy_folder", &copy_folder_uri, "/api/folder/copy.php",
     "?session_token=token&folder_key_src=s&folder_key_dst=d&version=2",
     "Quillmere API: copy_folder\n", "copy_folder url:\n", "Got text:\n", true,
     error_reading::direct, true,
     "<new_folderkey>new</new_folderkey>", "", "key=new", "key=NULL",
     [] { return copy_folder_call("token", "s", "d"); }},
    {"move_folder", &move_folder_uri, "/api/folder/move.php",
     "?session_token=token&folder_key_src=s&folder_key_dst=d&version=2",
     "Quillmere API: move_folder\n", "move_folder url:\n", "Got text:\n", true,
     error_reading::direct, true,
     "", "", "", "",
     [] { return move_folder_call("token", "s", "d"); }},

    {"get_folder_content", &get_folder_content_uri, "/api/1.0/folder/get_content.php",
     "?session_token=token&folder_key=key&device_id=dev&chunk=2&content_type=files&version=2",
     "Quillmere API: get_folder_content\n", "get_folder_content url:\n", "Got text:\n", true,
     error_reading::direct, true,
     "<chunk_size>7</chunk_size><folder><name>d</name></folder><file><filename>f</filename></file>",
     "xml extract: folder size: 1, file size: 1\nget_folder_content Success\n",
     "folders=1 files=1 chunk=7 folders{foldername=d} files{filename=f}",
     "folders=0 files=0 chunk=0 folders=NULL files=NULL",
     [] { return folder_content_call("token", "key", "dev", "2", "files"); }},
    {"attach_foreign_folder", &attach_foreign_uri, "/api/folder/attach_foreign.php",
     "?session_token=token&folder_key=key&version=2",
     "Quillmere API: attach_foreign\n", "attach_foreign_folder url:\n", "Got text:\n", true,
     error_reading::direct, true,
     "", "", "", "",
     [] { return attach_foreign_call("token", "key"); }},
    {"detach_foreign_folder", &detach_foreign_uri, "/api/folder/detach_foreign.php",
     "?session_token=token&folder_key=key&version=2",
     "Quillmere API: detach_foreign\n", "detach_foreign_folder url:\n", "Got text:\n", true,
     error_reading::direct, true,
     "", "", "", "",
     [] { return detach_foreign_call("token", "key"); }},

    {"get_file_info", &get_file_info_uri, "/api/file/get_info.php",
     "?quick_key=quick&session_token=token&version=2",
     "", "\nget_file_info url text:\n", "Got text:\n", true, error_reading::standard, true,
     "<file_info><filename>n</filename></file_info>", "", "record{filename=n}", "record=NULL",
     [] { return file_info_call("quick", "token"); }},
    {"create_file", &create_file_uri, "/api/file/create.php",
     "?session_token=token&filename=n&file_extension=e&parent_key=p&mtime=t&version=2",
     "", "create_file: url: ", "Got response:\n", false, error_reading::standard, true,
     "<quickkey>new</quickkey>", "", "key=new", "key=NULL",
     [] { return create_file_call("token", "n", "e", "p", "t"); }},
    {"delete_file", &delete_file_uri, "/api/file/delete.php",
     "?session_token=token&quick_key=quick&version=2",
     "", "delete_file: url: ", "Got response:\n", false, error_reading::standard, true,
     "", "", "", "",
     [] { return delete_file_call("token", "quick"); }},
    {"copy_file", &copy_file_uri, "/api/file/copy.php",
     "?session_token=token&quick_key=quick&folder_key=key&version=2",
     "", "copy_file: url: ", "Got response:\n", false, error_reading::standard, true,
     "<new_quickkey>new</new_quickkey>", "", "key=new", "key=NULL",
     [] { return copy_file_call("token", "quick", "key"); }},
    {"move_file", &move_file_uri, "/api/file/move.php",
     "?session_token=token&quick_key=quick&folder_key=key&version=2",
     "", "move_file: url: ", "Got response:\n", false, error_reading::standard, true,
     "", "", "", "",
     [] { return move_file_call("token", "quick", "key"); }},

    {"get_links", &get_links_uri, "/api/file/get_links.php",
     "?quick_key=quick&link_type=view&session_token=token&version=2",
     "", "get_links url: ", "Got text:\n", false, error_reading::standard, true,
     "<links><link><view>v</view></link></links>",
     "xml extract: found link\nxml extract: num_file_links 1\nget_links Success\n",
     "count=1 links{view=v}", "count=0 links=NULL",
     [] { return links_call("quick", "view", "token"); }},
    {"get_download_link", &get_download_link_uri, "/api/file/get_links.php",
     "?session_token=token&quick_key=quick&link_type=direct_download&version=2",
     "", "get_download_link url: ", "Got text:\n", false, error_reading::standard, true,
     "<direct_download>//h/f</direct_download>"
     "<direct_download_free_bandwidth>9</direct_download_free_bandwidth>"
     "<direct_download_error>3</direct_download_error>"
     "<direct_download_error_message>m</direct_download_error_message>", "",
     "url=http://h/f bandwidth=9 error=3 text=m", "url=NULL bandwidth=0 error=0 text=NULL",
     [] { return download_link_call("token", "quick"); }},

    {"get_device_changes", &get_device_changes_uri, "/api/device/get_changes.php",
     "?session_token=token&revision=12&device_id=34&version=2",
     "", "get_changes url: ", "Got text:\n", false, error_reading::standard, true,
     "<updated><file><quickkey>k</quickkey><revision>8</revision></file></updated>"
     "<device_revision>59</device_revision><changes_list_block>500</changes_list_block>",
     "xml extract: num changes: 0\nxml extract: num changes: 1\n",
     "revision=59 count=1 block=500 changes{8 updated file: key=k}",
     "revision=0 count=0 block=0 changes=NULL",
     [] { return device_changes_call("token", 12, 34); }},
};
// clang-format on

} // namespace quillmere_test
