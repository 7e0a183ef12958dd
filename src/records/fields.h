// The fields of each kind of record, written down once. A list is walked with FIELD(record, type,
// name) for each field and SEP between them; the lists are in the order of the constructor's
// arguments, which is the order of storage too but for folder_info.
#pragma once

#include <memory>

#include "quillmere.h"

// A field's name and type cannot stand in parentheses.
// NOLINTBEGIN(bugprone-macro-parentheses)
// clang-format off
#define NOTHING
#define FILE_INFO_FIELDS(FIELD, record, SEP)          \
    FIELD(record, char *, quickkey)               SEP \
    FIELD(record, char *, parent_folderkey)       SEP \
    FIELD(record, char *, filename)               SEP \
    FIELD(record, char *, created)                SEP \
    FIELD(record, char *, downloads)              SEP \
    FIELD(record, char *, desc)                   SEP \
    FIELD(record, char *, tags)                   SEP \
    FIELD(record, char *, size)                   SEP \
    FIELD(record, char *, privacy)                SEP \
    FIELD(record, char *, type)                   SEP \
    FIELD(record, char *, mimetype)               SEP \
    FIELD(record, char *, hash)                   SEP \
    FIELD(record, char *, delete_date)            SEP \
    FIELD(record, char *, password_protected)     SEP \
    FIELD(record, char *, revision)               SEP \
    FIELD(record, char *, owner_name)             SEP \
    FIELD(record, char *, flag)                   SEP \
    FIELD(record, char *, shared_by_user)         SEP \
    FIELD(record, char *, permissions)

#define FOLDER_INFO_FIELDS(FIELD, record, SEP)      \
    FIELD(record, char *, folderkey)            SEP \
    FIELD(record, char *, foldername)           SEP \
    FIELD(record, char *, created)              SEP \
    FIELD(record, char *, desc)                 SEP \
    FIELD(record, char *, tags)                 SEP \
    FIELD(record, char *, foldercount)          SEP \
    FIELD(record, char *, filecount)            SEP \
    FIELD(record, char *, total_files)          SEP \
    FIELD(record, char *, total_folders)        SEP \
    FIELD(record, char *, total_size)           SEP \
    FIELD(record, char *, revision)             SEP \
    FIELD(record, char *, epoch)                SEP \
    FIELD(record, char *, shared)               SEP \
    FIELD(record, char *, owner_name)           SEP \
    FIELD(record, char *, parent_folderkey)     SEP \
    FIELD(record, char *, delete_date)          SEP \
    FIELD(record, char *, custom_url)           SEP \
    FIELD(record, char *, dbx_enabled)          SEP \
    FIELD(record, char *, flag)                 SEP \
    FIELD(record, char *, shared_by_user)       SEP \
    FIELD(record, char *, permissions)          SEP \
    FIELD(record, char *, avatar)               SEP \
    FIELD(record, char *, privacy)              SEP \
    FIELD(record, char *, byte_count)

// Deliberately: the revision is stored ahead of the totals.
#define FOLDER_INFO_STORED_FIELDS(FIELD, record, SEP) \
    FIELD(record, char *, folderkey)            SEP \
    FIELD(record, char *, foldername)           SEP \
    FIELD(record, char *, created)              SEP \
    FIELD(record, char *, desc)                 SEP \
    FIELD(record, char *, tags)                 SEP \
    FIELD(record, char *, foldercount)          SEP \
    FIELD(record, char *, filecount)            SEP \
    FIELD(record, char *, revision)             SEP \
    FIELD(record, char *, total_files)          SEP \
    FIELD(record, char *, total_folders)        SEP \
    FIELD(record, char *, total_size)           SEP \
    FIELD(record, char *, epoch)                SEP \
    FIELD(record, char *, shared)               SEP \
    FIELD(record, char *, owner_name)           SEP \
    FIELD(record, char *, parent_folderkey)     SEP \
    FIELD(record, char *, delete_date)          SEP \
    FIELD(record, char *, custom_url)           SEP \
    FIELD(record, char *, dbx_enabled)          SEP \
    FIELD(record, char *, flag)                 SEP \
    FIELD(record, char *, shared_by_user)       SEP \
    FIELD(record, char *, permissions)          SEP \
    FIELD(record, char *, avatar)               SEP \
    FIELD(record, char *, privacy)              SEP \
    FIELD(record, char *, byte_count)

#define USER_INFO_FIELDS(FIELD, record, SEP)              \
    FIELD(record, char *, email)                      SEP \
    FIELD(record, char *, first_name)                 SEP \
    FIELD(record, char *, last_name)                  SEP \
    FIELD(record, char *, display_name)               SEP \
    FIELD(record, char *, gender)                     SEP \
    FIELD(record, char *, birthdate)                  SEP \
    FIELD(record, char *, location)                   SEP \
    FIELD(record, char *, website)                    SEP \
    FIELD(record, char *, premium)                    SEP \
    FIELD(record, char *, bandwidth)                  SEP \
    FIELD(record, char *, created)                    SEP \
    FIELD(record, char *, max_upload)                 SEP \
    FIELD(record, char *, max_instant_upload)         SEP \
    FIELD(record, char *, validated)                  SEP \
    FIELD(record, char *, tos_accepted)               SEP \
    FIELD(record, char *, used_storage)               SEP \
    FIELD(record, char *, base_storage)               SEP \
    FIELD(record, char *, bonus_storage)              SEP \
    FIELD(record, char *, storage_limit)              SEP \
    FIELD(record, char *, storage_limit_exceeded)     SEP \
    FIELD(record, char *, options)                    SEP \
    FIELD(record, char *, fb_facebook_id)             SEP \
    FIELD(record, char *, fb_date_created)            SEP \
    FIELD(record, char *, fb_email)                   SEP \
    FIELD(record, char *, fb_facebook_url)            SEP \
    FIELD(record, char *, fb_name)                    SEP \
    FIELD(record, char *, fb_firstname)               SEP \
    FIELD(record, char *, fb_lastname)                SEP \
    FIELD(record, char *, fb_hometown)                SEP \
    FIELD(record, char *, fb_location)                SEP \
    FIELD(record, char *, fb_i18n)                    SEP \
    FIELD(record, char *, fb_timezone)                SEP \
    FIELD(record, char *, fb_linked)                  SEP \
    FIELD(record, char *, tw_twitter_id)              SEP \
    FIELD(record, char *, tw_date_created)            SEP \
    FIELD(record, char *, tw_screen_name)             SEP \
    FIELD(record, char *, tw_name)                    SEP \
    FIELD(record, char *, tw_i18n)                    SEP \
    FIELD(record, char *, tw_linked)

#define USER_LIMITS_FIELDS(FIELD, record, SEP)               \
    FIELD(record, char *, storage_base)                  SEP \
    FIELD(record, char *, storage_bonus)                 SEP \
    FIELD(record, char *, storage_limit)                 SEP \
    FIELD(record, char *, storage_used)                  SEP \
    FIELD(record, char *, bandwidth_limit)               SEP \
    FIELD(record, char *, bandwidth_used)                SEP \
    FIELD(record, char *, collaboration_limit)           SEP \
    FIELD(record, char *, collaboration_today)           SEP \
    FIELD(record, char *, one_time_downloads_limit)      SEP \
    FIELD(record, char *, one_time_downloads_today)      SEP \
    FIELD(record, char *, streaming_bandwidth_limit)     SEP \
    FIELD(record, char *, streaming_bandwidth_today)     SEP \
    FIELD(record, char *, upload_size_limit)

#define SYSTEM_LIMITS_FIELDS(FIELD, record, SEP)             \
    FIELD(record, char *, max_objects)                   SEP \
    FIELD(record, char *, max_keys)                      SEP \
    FIELD(record, char *, max_image_size)                SEP \
    FIELD(record, char *, zip_max_filesize)              SEP \
    FIELD(record, char *, zip_max_total_filesize)        SEP \
    FIELD(record, char *, folder_content_chunk_size)     SEP \
    FIELD(record, char *, folder_depth_limit)            SEP \
    FIELD(record, char *, limit_search_results)          SEP \
    FIELD(record, char *, daily_shares_limit)            SEP \
    FIELD(record, char *, device_changes_list_limit)

#define SYSTEM_STATUS_FIELDS(FIELD, record, SEP) \
    FIELD(record, char *, database)     SEP \
    FIELD(record, char *, memcache)

#define CHANGE_INFO_FIELDS(FIELD, record, SEP)      \
    FIELD(record, char *, key)                  SEP \
    FIELD(record, char *, parent_folderkey)     SEP \
    FIELD(record, char *, created)              SEP \
    FIELD(record, uint64_t, revision)           SEP \
    FIELD(record, int32_t, is_folder)           SEP \
    FIELD(record, int32_t, changetype)          SEP \
    FIELD(record, char *, filename)             SEP \
    FIELD(record, char *, mimetype)             SEP \
    FIELD(record, char *, filetype)

#define FILE_LINKS_FIELDS(FIELD, record, SEP)                      \
    FIELD(record, char *, quickkey)                            SEP \
    FIELD(record, char *, view)                                SEP \
    FIELD(record, char *, listen)                              SEP \
    FIELD(record, char *, watch)                               SEP \
    FIELD(record, char *, normal_download)                     SEP \
    FIELD(record, char *, direct_download)                     SEP \
    FIELD(record, char *, direct_download_error_message)       SEP \
    FIELD(record, char *, direct_download_error)               SEP \
    FIELD(record, char *, edit)                                SEP \
    FIELD(record, char *, edit_error_message)                  SEP \
    FIELD(record, char *, one_time_download)                   SEP \
    FIELD(record, char *, one_time_download_error_message)     SEP \
    FIELD(record, char *, error)

#define STORED_FIELD(record, type, name) type name;
#define DECLARE_RECORD(record, STORED_FIELDS)                                 \
    struct record { STORED_FIELDS(STORED_FIELD, record, NOTHING) };           \
    namespace quillmere {                                                     \
    inline void delete_record(record *deleted) { record##_delete(&deleted); } \
    }
// clang-format on
// NOLINTEND(bugprone-macro-parentheses)

DECLARE_RECORD(file_info, FILE_INFO_FIELDS)
DECLARE_RECORD(folder_info, FOLDER_INFO_STORED_FIELDS)
DECLARE_RECORD(user_info, USER_INFO_FIELDS)
DECLARE_RECORD(user_limits, USER_LIMITS_FIELDS)
DECLARE_RECORD(system_limits, SYSTEM_LIMITS_FIELDS)
DECLARE_RECORD(system_status, SYSTEM_STATUS_FIELDS)
DECLARE_RECORD(change_info, CHANGE_INFO_FIELDS)
DECLARE_RECORD(file_links, FILE_LINKS_FIELDS)

namespace quillmere {

struct record_deleter {
    template <class Record> void operator()(Record *record) const { delete_record(record); }
};

template <class Record> using owned_record = std::unique_ptr<Record, record_deleter>;

} // namespace quillmere
