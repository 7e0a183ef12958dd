// The eight kinds of record as their callers know them: the fields in the order of the
// constructor's arguments, each with its getter. Written out, so that it is no copy of the
// library's own lists.
#pragma once

#include <cstdint>
#include <initializer_list>

#include "quillmere.h"

namespace quillmere_test {

template <class Record> struct text_field {
    const char *name;
    const char *(*get)(const Record *);
};

// Stands for a record wherever a type must be complete, which the records are not for callers.
template <class Record> struct record_kind;

template <> struct record_kind<file_info> {
    using record = file_info;
    static constexpr auto create = file_info_new;
    static constexpr auto destroy = file_info_delete;
    static constexpr text_field<file_info> texts[] = {
        {"quickkey", file_info_get_quickkey},
        {"parent_folderkey", file_info_get_parent_folderkey},
        {"filename", file_info_get_filename},
        {"created", file_info_get_created},
        {"downloads", file_info_get_downloads},
        {"desc", file_info_get_desc},
        {"tags", file_info_get_tags},
        {"size", file_info_get_size},
        {"privacy", file_info_get_privacy},
        {"type", file_info_get_type},
        {"mimetype", file_info_get_mimetype},
        {"hash", file_info_get_hash},
        {"delete_date", file_info_get_delete_date},
        {"password_protected", file_info_get_password_protected},
        {"revision", file_info_get_revision},
        {"owner_name", file_info_get_owner_name},
        {"flag", file_info_get_flag},
        {"shared_by_user", file_info_get_shared_by_user},
        {"permissions", file_info_get_permissions},
    };
};

template <> struct record_kind<folder_info> {
    using record = folder_info;
    static constexpr auto create = folder_info_new;
    static constexpr auto destroy = folder_info_delete;
    static constexpr text_field<folder_info> texts[] = {
        {"folderkey", folder_info_get_folderkey},
        {"foldername", folder_info_get_foldername},
        {"created", folder_info_get_created},
        {"desc", folder_info_get_desc},
        {"tags", folder_info_get_tags},
        {"foldercount", folder_info_get_foldercount},
        {"filecount", folder_info_get_filecount},
        {"total_files", folder_info_get_total_files},
        {"total_folders", folder_info_get_total_folders},
        {"total_size", folder_info_get_total_size},
        {"revision", folder_info_get_revision},
        {"epoch", folder_info_get_epoch},
        {"shared", folder_info_get_shared},
        {"owner_name", folder_info_get_owner_name},
        {"parent_folderkey", folder_info_get_parent_folderkey},
        {"delete_date", folder_info_get_delete_date},
        {"custom_url", folder_info_get_custom_url},
        {"dbx_enabled", folder_info_get_dbx_enabled},
        {"flag", folder_info_get_flag},
        {"shared_by_user", folder_info_get_shared_by_user},
        {"permissions", folder_info_get_permissions},
        {"avatar", folder_info_get_avatar},
        {"privacy", folder_info_get_privacy},
        {"byte_count", folder_info_get_byte_count},
    };
};

template <> struct record_kind<user_info> {
    using record = user_info;
    static constexpr auto create = user_info_new;
    static constexpr auto destroy = user_info_delete;
    static constexpr text_field<user_info> texts[] = {
        {"email", user_info_get_email},
        {"first_name", user_info_get_first_name},
        {"last_name", user_info_get_last_name},
        {"display_name", user_info_get_display_name},
        {"gender", user_info_get_gender},
        {"birthdate", user_info_get_birthdate},
        {"location", user_info_get_location},
        {"website", user_info_get_website},
        {"premium", user_info_get_premium},
        {"bandwidth", user_info_get_bandwidth},
        {"created", user_info_get_created},
        {"max_upload", user_info_get_max_upload},
        {"max_instant_upload", user_info_get_max_instant_upload},
        {"validated", user_info_get_validated},
        {"tos_accepted", user_info_get_tos_accepted},
        {"used_storage", user_info_get_used_storage},
        {"base_storage", user_info_get_base_storage},
        {"bonus_storage", user_info_get_bonus_storage},
        {"storage_limit", user_info_get_storage_limit},
        {"storage_limit_exceeded", user_info_get_storage_limit_exceeded},
        {"options", user_info_get_options},
        {"fb_facebook_id", user_info_get_fb_facebook_id},
        {"fb_date_created", user_info_get_fb_date_created},
        {"fb_email", user_info_get_fb_email},
        {"fb_facebook_url", user_info_get_fb_facebook_url},
        {"fb_name", user_info_get_fb_name},
        {"fb_firstname", user_info_get_fb_firstname},
        {"fb_lastname", user_info_get_fb_lastname},
        {"fb_hometown", user_info_get_fb_hometown},
        {"fb_location", user_info_get_fb_location},
        {"fb_i18n", user_info_get_fb_i18n},
        {"fb_timezone", user_info_get_fb_timezone},
        {"fb_linked", user_info_get_fb_linked},
        {"tw_twitter_id", user_info_get_tw_twitter_id},
        {"tw_date_created", user_info_get_tw_date_created},
        {"tw_screen_name", user_info_get_tw_screen_name},
        {"tw_name", user_info_get_tw_name},
        {"tw_i18n", user_info_get_tw_i18n},
        {"tw_linked", user_info_get_tw_linked},
    };
};

template <> struct record_kind<user_limits> {
    using record = user_limits;
    static constexpr auto create = user_limits_new;
    static constexpr auto destroy = user_limits_delete;
    static constexpr text_field<user_limits> texts[] = {
        {"storage_base", user_limits_get_storage_base},
        {"storage_bonus", user_limits_get_storage_bonus},
        {"storage_limit", user_limits_get_storage_limit},
        {"storage_used", user_limits_get_storage_used},
        {"bandwidth_limit", user_limits_get_bandwidth_limit},
        {"bandwidth_used", user_limits_get_bandwidth_used},
        {"collaboration_limit", user_limits_get_collaboration_limit},
        {"collaboration_today", user_limits_get_collaboration_today},
        {"one_time_downloads_limit", user_limits_get_one_time_downloads_limit},
        {"one_time_downloads_today", user_limits_get_one_time_downloads_today},
        {"streaming_bandwidth_limit", user_limits_get_streaming_bandwidth_limit},
        {"streaming_bandwidth_today", user_limits_get_streaming_bandwidth_today},
        {"upload_size_limit", user_limits_get_upload_size_limit},
    };
};

template <> struct record_kind<system_limits> {
    using record = system_limits;
    static constexpr auto create = system_limits_new;
    static constexpr auto destroy = system_limits_delete;
    static constexpr text_field<system_limits> texts[] = {
        {"max_objects", system_limits_get_max_objects},
        {"max_keys", system_limits_get_max_keys},
        {"max_image_size", system_limits_get_max_image_size},
        {"zip_max_filesize", system_limits_get_zip_max_filesize},
        {"zip_max_total_filesize", system_limits_get_zip_max_total_filesize},
        {"folder_content_chunk_size", system_limits_get_folder_content_chunk_size},
        {"folder_depth_limit", system_limits_get_folder_depth_limit},
        {"limit_search_results", system_limits_get_limit_search_results},
        {"daily_shares_limit", system_limits_get_daily_shares_limit},
        {"device_changes_list_limit", system_limits_get_device_changes_list_limit},
    };
};

template <> struct record_kind<system_status> {
    using record = system_status;
    static constexpr auto create = system_status_new;
    static constexpr auto destroy = system_status_delete;
    static constexpr text_field<system_status> texts[] = {
        {"database", system_status_get_database},
        {"memcache", system_status_get_memcache},
    };
};

template <> struct record_kind<change_info> {
    using record = change_info;
    static constexpr auto create = change_info_new;
    static constexpr auto destroy = change_info_delete;
    static constexpr text_field<change_info> texts[] = {
        {"key", change_info_get_key},
        {"parent_folderkey", change_info_get_parent_folderkey},
        {"created", change_info_get_created},
        {"filename", change_info_get_filename},
        {"mimetype", change_info_get_mimetype},
        {"filetype", change_info_get_filetype},
    };
};

template <> struct record_kind<file_links> {
    using record = file_links;
    static constexpr auto create = file_links_new;
    static constexpr auto destroy = file_links_delete;
    static constexpr text_field<file_links> texts[] = {
        {"quickkey", file_links_get_quickkey},
        {"view", file_links_get_view},
        {"listen", file_links_get_listen},
        {"watch", file_links_get_watch},
        {"normal_download", file_links_get_normal_download},
        {"direct_download", file_links_get_direct_download},
        {"direct_download_error_message", file_links_get_direct_download_error_message},
        {"direct_download_error", file_links_get_direct_download_error},
        {"edit", file_links_get_edit},
        {"edit_error_message", file_links_get_edit_error_message},
        {"one_time_download", file_links_get_one_time_download},
        {"one_time_download_error_message", file_links_get_one_time_download_error_message},
        {"error", file_links_get_error},
    };
};

} // namespace quillmere_test
