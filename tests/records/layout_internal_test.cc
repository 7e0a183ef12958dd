// The order in which the records keep their fields. Callers cannot see it, but it is fixed.
#include <gtest/gtest.h>

#include <cstddef>
#include <ostream>
#include <vector>

#include "records/fields.h"

namespace quillmere_test {
namespace {

struct stored_field {
    const char *name;
    size_t offset;
};

struct record_layout {
    const char *record;
    size_t size;
    std::vector<stored_field> fields;
};

std::ostream &operator<<(std::ostream &out, const record_layout &layout)
{
    return out << layout.record;
}

#define FIELD_OF(record, field)                                                                    \
    {                                                                                              \
#field, offsetof(record, field)                                                            \
    }

class StoredTexts : public testing::TestWithParam<record_layout> {};

TEST_P(StoredTexts, StandInTheirOrderWithoutGaps)
{
    const record_layout &layout = GetParam();

    for (size_t index = 0; index < layout.fields.size(); ++index)
        EXPECT_EQ(layout.fields[index].offset, index * sizeof(char *)) << layout.fields[index].name;
    EXPECT_EQ(layout.size, layout.fields.size() * sizeof(char *));
}

INSTANTIATE_TEST_SUITE_P(
    OfFileInfo, StoredTexts,
    testing::Values(record_layout{
        "file_info",
        sizeof(file_info),
        {
            FIELD_OF(file_info, quickkey),    FIELD_OF(file_info, parent_folderkey),
            FIELD_OF(file_info, filename),    FIELD_OF(file_info, created),
            FIELD_OF(file_info, downloads),   FIELD_OF(file_info, desc),
            FIELD_OF(file_info, tags),        FIELD_OF(file_info, size),
            FIELD_OF(file_info, privacy),     FIELD_OF(file_info, type),
            FIELD_OF(file_info, mimetype),    FIELD_OF(file_info, hash),
            FIELD_OF(file_info, delete_date), FIELD_OF(file_info, password_protected),
            FIELD_OF(file_info, revision),    FIELD_OF(file_info, owner_name),
            FIELD_OF(file_info, flag),        FIELD_OF(file_info, shared_by_user),
            FIELD_OF(file_info, permissions),
        }}));

INSTANTIATE_TEST_SUITE_P(OfFolderInfo, StoredTexts,
                         testing::Values(record_layout{"folder_info",
                                                       sizeof(folder_info),
                                                       {
                                                           FIELD_OF(folder_info, folderkey),
                                                           FIELD_OF(folder_info, foldername),
                                                           FIELD_OF(folder_info, created),
                                                           FIELD_OF(folder_info, desc),
                                                           FIELD_OF(folder_info, tags),
                                                           FIELD_OF(folder_info, foldercount),
                                                           FIELD_OF(folder_info, filecount),
                                                           FIELD_OF(folder_info, revision),
                                                           FIELD_OF(folder_info, total_files),
                                                           FIELD_OF(folder_info, total_folders),
                                                           FIELD_OF(folder_info, total_size),
                                                           FIELD_OF(folder_info, epoch),
                                                           FIELD_OF(folder_info, shared),
                                                           FIELD_OF(folder_info, owner_name),
                                                           FIELD_OF(folder_info, parent_folderkey),
                                                           FIELD_OF(folder_info, delete_date),
                                                           FIELD_OF(folder_info, custom_url),
                                                           FIELD_OF(folder_info, dbx_enabled),
                                                           FIELD_OF(folder_info, flag),
                                                           FIELD_OF(folder_info, shared_by_user),
                                                           FIELD_OF(folder_info, permissions),
                                                           FIELD_OF(folder_info, avatar),
                                                           FIELD_OF(folder_info, privacy),
                                                           FIELD_OF(folder_info, byte_count),
                                                       }}));

INSTANTIATE_TEST_SUITE_P(OfUserInfo, StoredTexts,
                         testing::Values(record_layout{
                             "user_info",
                             sizeof(user_info),
                             {
                                 FIELD_OF(user_info, email),
                                 FIELD_OF(user_info, first_name),
                                 FIELD_OF(user_info, last_name),
                                 FIELD_OF(user_info, display_name),
                                 FIELD_OF(user_info, gender),
                                 FIELD_OF(user_info, birthdate),
                                 FIELD_OF(user_info, location),
                                 FIELD_OF(user_info, website),
                                 FIELD_OF(user_info, premium),
                                 FIELD_OF(user_info, bandwidth),
                                 FIELD_OF(user_info, created),
                                 FIELD_OF(user_info, max_upload),
                                 FIELD_OF(user_info, max_instant_upload),
                                 FIELD_OF(user_info, validated),
                                 FIELD_OF(user_info, tos_accepted),
                                 FIELD_OF(user_info, used_storage),
                                 FIELD_OF(user_info, base_storage),
                                 FIELD_OF(user_info, bonus_storage),
                                 FIELD_OF(user_info, storage_limit),
                                 FIELD_OF(user_info, storage_limit_exceeded),
                                 FIELD_OF(user_info, options),
                                 FIELD_OF(user_info, fb_facebook_id),
                                 FIELD_OF(user_info, fb_date_created),
                                 FIELD_OF(user_info, fb_email),
                                 FIELD_OF(user_info, fb_facebook_url),
                                 FIELD_OF(user_info, fb_name),
                                 FIELD_OF(user_info, fb_firstname),
                                 FIELD_OF(user_info, fb_lastname),
                                 FIELD_OF(user_info, fb_hometown),
                                 FIELD_OF(user_info, fb_location),
                                 FIELD_OF(user_info, fb_i18n),
                                 FIELD_OF(user_info, fb_timezone),
                                 FIELD_OF(user_info, fb_linked),
                                 FIELD_OF(user_info, tw_twitter_id),
                                 FIELD_OF(user_info, tw_date_created),
                                 FIELD_OF(user_info, tw_screen_name),
                                 FIELD_OF(user_info, tw_name),
                                 FIELD_OF(user_info, tw_i18n),
                                 FIELD_OF(user_info, tw_linked),
                             }}));

INSTANTIATE_TEST_SUITE_P(OfUserLimits, StoredTexts,
                         testing::Values(record_layout{
                             "user_limits",
                             sizeof(user_limits),
                             {
                                 FIELD_OF(user_limits, storage_base),
                                 FIELD_OF(user_limits, storage_bonus),
                                 FIELD_OF(user_limits, storage_limit),
                                 FIELD_OF(user_limits, storage_used),
                                 FIELD_OF(user_limits, bandwidth_limit),
                                 FIELD_OF(user_limits, bandwidth_used),
                                 FIELD_OF(user_limits, collaboration_limit),
                                 FIELD_OF(user_limits, collaboration_today),
                                 FIELD_OF(user_limits, one_time_downloads_limit),
                                 FIELD_OF(user_limits, one_time_downloads_today),
                                 FIELD_OF(user_limits, streaming_bandwidth_limit),
                                 FIELD_OF(user_limits, streaming_bandwidth_today),
                                 FIELD_OF(user_limits, upload_size_limit),
                             }}));

INSTANTIATE_TEST_SUITE_P(OfSystemLimits, StoredTexts,
                         testing::Values(record_layout{
                             "system_limits",
                             sizeof(system_limits),
                             {
                                 FIELD_OF(system_limits, max_objects),
                                 FIELD_OF(system_limits, max_keys),
                                 FIELD_OF(system_limits, max_image_size),
                                 FIELD_OF(system_limits, zip_max_filesize),
                                 FIELD_OF(system_limits, zip_max_total_filesize),
                                 FIELD_OF(system_limits, folder_content_chunk_size),
                                 FIELD_OF(system_limits, folder_depth_limit),
                                 FIELD_OF(system_limits, limit_search_results),
                                 FIELD_OF(system_limits, daily_shares_limit),
                                 FIELD_OF(system_limits, device_changes_list_limit),
                             }}));

INSTANTIATE_TEST_SUITE_P(OfSystemStatus, StoredTexts,
                         testing::Values(record_layout{"system_status",
                                                       sizeof(system_status),
                                                       {
                                                           FIELD_OF(system_status, database),
                                                           FIELD_OF(system_status, memcache),
                                                       }}));

INSTANTIATE_TEST_SUITE_P(OfFileLinks, StoredTexts,
                         testing::Values(record_layout{
                             "file_links",
                             sizeof(file_links),
                             {
                                 FIELD_OF(file_links, quickkey),
                                 FIELD_OF(file_links, view),
                                 FIELD_OF(file_links, listen),
                                 FIELD_OF(file_links, watch),
                                 FIELD_OF(file_links, normal_download),
                                 FIELD_OF(file_links, direct_download),
                                 FIELD_OF(file_links, direct_download_error_message),
                                 FIELD_OF(file_links, direct_download_error),
                                 FIELD_OF(file_links, edit),
                                 FIELD_OF(file_links, edit_error_message),
                                 FIELD_OF(file_links, one_time_download),
                                 FIELD_OF(file_links, one_time_download_error_message),
                                 FIELD_OF(file_links, error),
                             }}));

TEST(StoredChange, HasItsNumbersBetweenTheTexts)
{
    EXPECT_EQ(offsetof(change_info, key), 0u);
    EXPECT_EQ(offsetof(change_info, parent_folderkey), 8u);
    EXPECT_EQ(offsetof(change_info, created), 16u);
    EXPECT_EQ(offsetof(change_info, revision), 24u);
    EXPECT_EQ(offsetof(change_info, is_folder), 32u);
    EXPECT_EQ(offsetof(change_info, changetype), 36u);
    EXPECT_EQ(offsetof(change_info, filename), 40u);
    EXPECT_EQ(offsetof(change_info, mimetype), 48u);
    EXPECT_EQ(offsetof(change_info, filetype), 56u);
    EXPECT_EQ(sizeof(change_info), 64u);
}

} // namespace
} // namespace quillmere_test
