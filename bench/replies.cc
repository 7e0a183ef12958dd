#include "replies.h"

#include <cstdio>

namespace quillmere_bench {
namespace {

std::string success(const std::string &inside)
{
    return "<?xml version=\"1.0\" encoding=\"utf-8\"?><response><action>of the service</action>" +
           inside + "<result>Success</result><current_api_version>2.15</current_api_version>" +
           "</response>";
}

std::string element(const std::string &name, const std::string &text)
{
    return "<" + name + ">" + text + "</" + name + ">";
}

// Every element with a text as long as such texts are.
template <class Names> std::string elements(const Names &names)
{
    std::string all;
    for (const char *name : names)
        all += element(name, "a value of its own");
    return all;
}

constexpr const char *folder_elements[] = {
    "folderkey",    "name",       "created",         "description",   "tags",
    "folder_count", "file_count", "total_files",     "total_folders", "total_size",
    "revision",     "epoch",      "shared",          "owner_name",    "parent_folderkey",
    "delete_date",  "custom_url", "dropbox_enabled", "flag",          "shared_by_user",
    "permissions",  "avatar",     "privacy",         "byte_count",
};

constexpr const char *user_elements[] = {
    "email",
    "first_name",
    "last_name",
    "display_name",
    "gender",
    "birth_date",
    "location",
    "website",
    "premium",
    "bandwidth",
    "created",
    "max_upload_size",
    "max_instant_upload_size",
    "validated",
    "tos_accepted",
    "used_storage_size",
    "base_storage",
    "bonus_storage",
    "storage_limit",
    "storage_limit_exceeded",
    "options",
};

constexpr const char *facebook_elements[] = {
    "facebook_id", "date_created", "email",    "facebook_url", "name",     "firstname",
    "lastname",    "hometown",     "location", "i18n",         "timezone",
};

constexpr const char *twitter_elements[] = {
    "twitter_id", "date_created", "screen_name", "name", "i18n",
};

// 608 bytes in 18 elements.
std::string file_entry(unsigned number)
{
    char digits[16];
    std::snprintf(digits, sizeof digits, "%06u", number);
    const std::string six = digits;
    return "<file><quickkey>k4x9w2m7q" + six + "</quickkey><filename>pictures of the summer, " +
           six +
           ".jpeg</filename><created>2026-01-01 00:00:00</created><downloads>0</downloads>"
           "<desc>taken from the boat, at noon</desc><tags>summer,boat,2026</tags><size>4096</size>"
           "<privacy>private</privacy><filetype>image</filetype><mimetype>image/jpeg</mimetype>"
           "<hash>e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855</hash>"
           "<password_protected>no</password_protected><revision>" +
           six +
           "</revision><owner_name>Ada Lovelace</owner_name><flag>1</flag>"
           "<shared_by_user>0</shared_by_user><permissions>4</permissions></file>";
}

} // namespace

std::string folder_record() { return success(element("folder_info", elements(folder_elements))); }

std::string user_record()
{
    return success(
        element("user_info",
                elements(user_elements) +
                    element("facebook", element("linked", "yes") + elements(facebook_elements)) +
                    element("twitter", element("linked", "yes") + elements(twitter_elements))));
}

std::string listing(unsigned entries)
{
    std::string files;
    for (unsigned number = 0; number < entries; ++number)
        files += file_entry(number);
    return success("<folder_content><chunk_size>1000</chunk_size><content_type>files</content_type>"
                   "<chunk_number>1</chunk_number><files>" +
                   files + "</files></folder_content>");
}

std::string change_feed(unsigned changes)
{
    std::string files;
    for (unsigned number = 1; number <= changes; ++number) {
        std::string digits = std::to_string(number);
        files += "<file><quickkey>k" + digits + "</quickkey><filename>file " + digits +
                 ".txt</filename><parent_folderkey>folder</parent_folderkey>"
                 "<created>2026-01-01 00:00:00</created><mimetype>text/plain</mimetype>"
                 "<filetype>text</filetype><revision>" +
                 digits + "</revision></file>";
    }
    return success(
        "<device_revision>" + std::to_string(changes) +
        "</device_revision><changes_list_block>500</changes_list_block><updated><files>" + files +
        "</files></updated>");
}

} // namespace quillmere_bench
