#include "entry_fields.h"

#include "record_fields.h"
#include "remote_path.h"

namespace quillmere::tools {

namespace {

constexpr record_field<folder_info> folder_fields[] = {
    {"key", "Key", folder_info_get_folderkey},
    {"name", "Name", folder_info_get_foldername},
    {"parent_key", "In folder", folder_info_get_parent_folderkey},
    {"created", "Created", folder_info_get_created},
    {"delete_date", "Deleted", folder_info_get_delete_date},
    {"description", "Description", folder_info_get_desc},
    {"tags", "Tags", folder_info_get_tags},
    {"privacy", "Privacy", folder_info_get_privacy},
    {"revision", "Revision", folder_info_get_revision, field_value::number},
    {"epoch", "Epoch", folder_info_get_epoch, field_value::number},
    {"folder_count", "Folders", folder_info_get_foldercount, field_value::number},
    {"file_count", "Files", folder_info_get_filecount, field_value::number},
    {"byte_count", "Bytes", folder_info_get_byte_count, field_value::number},
    {"total_folders", "Folders, all levels", folder_info_get_total_folders, field_value::number},
    {"total_files", "Files, all levels", folder_info_get_total_files, field_value::number},
    {"total_size", "Bytes, all levels", folder_info_get_total_size, field_value::number},
    {"owner_name", "Owner", folder_info_get_owner_name},
    {"shared", "Shared", folder_info_get_shared},
    {"shared_by_user", "Shared by you", folder_info_get_shared_by_user},
    {"permissions", "Permissions", folder_info_get_permissions},
    {"flag", "Flag", folder_info_get_flag},
    {"custom_url", "Address", folder_info_get_custom_url},
    {"dropbox_enabled", "Drop box", folder_info_get_dbx_enabled},
    {"avatar", "Picture", folder_info_get_avatar},
};

constexpr record_field<file_info> file_fields[] = {
    {"key", "Key", file_info_get_quickkey},
    {"name", "Name", file_info_get_filename},
    {"parent_key", "In folder", file_info_get_parent_folderkey},
    {"created", "Created", file_info_get_created},
    {"delete_date", "Deleted", file_info_get_delete_date},
    {"description", "Description", file_info_get_desc},
    {"tags", "Tags", file_info_get_tags},
    {"privacy", "Privacy", file_info_get_privacy},
    {"revision", "Revision", file_info_get_revision, field_value::number},
    {"size", "Size", file_info_get_size, field_value::number},
    {"hash", "Hash", file_info_get_hash},
    {"filetype", "Type", file_info_get_type},
    {"mimetype", "Media type", file_info_get_mimetype},
    {"downloads", "Downloads", file_info_get_downloads, field_value::number},
    {"owner_name", "Owner", file_info_get_owner_name},
    {"shared_by_user", "Shared by you", file_info_get_shared_by_user},
    {"permissions", "Permissions", file_info_get_permissions},
    {"flag", "Flag", file_info_get_flag},
    {"password_protected", "Password needed", file_info_get_password_protected},
};

std::vector<fact> with_kind(entry_kind kind, std::vector<fact> facts)
{
    facts.insert(facts.begin(), {"kind", "Kind", word_for(kind)});
    return facts;
}

} // namespace

std::vector<fact> facts_of(const folder_info *record)
{
    return with_kind(entry_kind::folder, facts_of(record, folder_fields));
}

std::vector<fact> facts_of(const file_info *record)
{
    return with_kind(entry_kind::file, facts_of(record, file_fields));
}

} // namespace quillmere::tools
