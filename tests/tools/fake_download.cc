#include "fake_download.h"

#include <filesystem>

namespace quillmere_test {

fake_download::fake_download()
{
    std::filesystem::create_directory(into);
    home.environment["QUILLMERE_SERVICE"] = server.base_url();
    home.environment["SSL_CERT_FILE"] = test_root_path();
    home.sign_in(server.base_url(), "token");
    bytes_reply = [this](const request &) { return http_reply(200, bytes); };
    server.script([this](connection &client) { serve(client); });
}

std::string fake_download::file_facts() const
{
    return "<quickkey>k</quickkey><filename>" + name + "</filename><hash>" + sha256_of(bytes) +
           "</hash><size>" + std::to_string(bytes.size()) + "</size>";
}

std::string fake_download::reply_to(const request &asked) const
{
    const std::string path = asked.path();
    if (path == "/api/file/get_info.php")
        return success_reply("<file_info>" + file_facts() + "</file_info>");
    if (path == "/api/folder/get_info.php" && asked.parameter("folder_key") == "f")
        return success_reply("<folder_info><folderkey>f</folderkey><name>f</name></folder_info>");
    if (path == "/api/1.0/folder/get_content.php")
        return success_reply(asked.parameter("content_type") == "files"
                                 ? "<files><file>" + file_facts() + "</file></files>"
                                 : "");
    if (path == "/api/device/get_status.php" || path == "/api/device/get_changes.php")
        return success_reply("<device_revision>1</device_revision>");
    if (path == "/api/user/myfiles_revision.php")
        return success_reply("<revision>1</revision><epoch>1</epoch>");
    if (path == "/api/file/get_links.php")
        return success_reply("<links><link><quickkey>k</quickkey><direct_download>" + link +
                             "</direct_download></link></links>");
    if (path == "/bytes")
        return bytes_reply(asked);
    return http_reply(404, "<response><result>Error</result><error>112</error>"
                           "<message>no</message></response>");
}

void fake_download::serve(connection &client) const
{
    const request asked = client.read_request();
    if (on_bytes && asked.path() == "/bytes")
        return on_bytes(client);
    client.send(reply_to(asked));
}

} // namespace quillmere_test
