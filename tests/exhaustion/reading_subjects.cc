// The calls that read a text: a sound one, and one that is cut off.
#include "api/taken_results.h"
#include "exhaustion/subject.h"

namespace quillmere_test {
namespace {

const std::string listing =
    "<response><folder_content><folders>"
    "<folder><folderkey>d1</folderkey><name>one</name><tags>a,b</tags></folder>"
    "<folder><folderkey>d2</folderkey><name>two &amp; more</name></folder></folders><files>"
    "<file><quickkey>f1</quickkey><filename>first</filename><size>1</size></file>"
    "<file><quickkey>f2</quickkey><filename>second</filename><hash>abc</hash></file></files>"
    "</folder_content><result>Success</result></response>";

const std::string feed =
    "<response><updated><files><file><quickkey>f1</quickkey><revision>2</revision>"
    "<filename>n</filename></file></files><folders><folder><folderkey>d1</folderkey>"
    "<revision>3</revision></folder></folders></updated><deleted><files>"
    "<file><quickkey>f2</quickkey><revision>4</revision></file></files></deleted></response>";

const std::string links =
    "<response><links><link><quickkey>f1</quickkey><view>v1</view></link>"
    "<link><quickkey>f2</quickkey><normal_download>n2</normal_download></link></links></response>";

const std::string refusal =
    "<response><result>Error</result><error>105</error><message>No &amp; never</message>"
    "</response>";

const std::string upload_reply =
    "HTTP/1.1 200 OK\r\nContent-Type: text/xml\r\n\r\n"
    "<response><doupload><result>0</result><key>up</key></doupload></response>";

call_outcome listing_read(const std::string &xml)
{
    folder_list *folders = folder_info_list_new();
    file_list *files = file_info_list_new();
    int32_t folder_count = rubbish_number;
    int32_t file_count = rubbish_number;
    uint32_t damaged = simple_extract_folders_content(xml.data(), xml.size(), folders,
                                                      &folder_count, files, &file_count);
    return {static_cast<int32_t>(damaged), std::nullopt,
            taken_number("folders", folder_count) + " " + taken_number("files", file_count) + " " +
                taken_list<delete_all_folder_list>("folders", folders) + " " +
                taken_list<delete_all_file_list>("files", files)};
}

call_outcome feed_read(const std::string &xml)
{
    change_list *changes = change_list_new();
    auto count = static_cast<uint32_t>(rubbish_number);
    uint32_t damaged = simple_extract_changes(xml.data(), xml.size(), changes, &count);
    return {static_cast<int32_t>(damaged), std::nullopt,
            taken_number("count", count) + " " +
                taken_list<delete_all_change_list>("changes", changes)};
}

call_outcome links_read(const std::string &xml)
{
    file_links_list *list = file_links_list_new();
    int32_t count = rubbish_number;
    uint32_t damaged = simple_extract_file_links(xml.data(), xml.size(), list, &count);
    return {static_cast<int32_t>(damaged), std::nullopt,
            taken_number("count", count) + " " +
                taken_list<delete_all_file_links_list>("links", list)};
}

call_outcome value_read(const std::string &xml)
{
    int32_t damaged = rubbish_number;
    char *value = simple_get_xml_node_value(xml.data(), xml.size(), "message", &damaged);
    return {damaged, std::nullopt, taken("value", value)};
}

call_outcome error_read(const std::string &xml)
{
    int32_t code = rubbish_number;
    char *message = rubbish<char>();
    get_error_from_xml(xml.data(), xml.size(), &code, &message);
    return outcome_of(code, message, "");
}

call_outcome upload_reply_read(const std::string &reply)
{
    char *key = rubbish<char>();
    int32_t status = parse_upload_response(reply.data(), reply.size(), &key);
    return {status, std::nullopt, taken("key", key)};
}

call_outcome upload_urls_made(const std::string &)
{
    return {0, std::nullopt,
            taken("new", get_upload_url("token", "key", 0)) + " " +
                taken("changed", get_patch_upload_url("token", "key", 7, "abc", 123, 1))};
}

call_outcome sample_read(const std::string &) { return sample_changes_call("token", 1, 2); }

using reader = call_outcome (*)(const std::string &);

std::vector<subject> all_readers()
{
    struct {
        const char *name;
        reader read;
        std::string text;
    } const readers[] = {
        {"simple_extract_folders_content", listing_read, listing},
        {"simple_extract_changes", feed_read, feed},
        {"simple_extract_file_links", links_read, links},
        {"simple_get_xml_node_value", value_read, refusal},
        {"get_error_from_xml", error_read, refusal},
        {"parse_upload_response", upload_reply_read, upload_reply},
    };
    std::vector<subject> all;
    for (const auto &each : readers) {
        std::string cut = each.text.substr(0, each.text.size() - 12);
        all.push_back({each.name, [each] { return [each] { return each.read(each.text); }; }});
        all.push_back({std::string(each.name) + "_of_a_cut_text",
                       [each, cut] { return [each, cut] { return each.read(cut); }; }});
    }
    all.push_back({"upload_urls", [] { return [] { return upload_urls_made(""); }; }});
    all.push_back({"test_get_device_changes", [] { return [] { return sample_read(""); }; }});
    return all;
}

} // namespace

const std::vector<subject> &reading_subjects()
{
    static const std::vector<subject> all = all_readers();
    return all;
}

} // namespace quillmere_test
