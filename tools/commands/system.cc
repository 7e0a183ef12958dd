// What the service tells of itself to anybody.

#include "commands.h"

#include "../heap.h"
#include "../record_fields.h"

namespace quillmere::tools {

namespace {

constexpr record_field<system_limits> limit_fields[] = {
    {"max_objects", "Objects", system_limits_get_max_objects, field_value::number},
    {"max_keys", "Keys", system_limits_get_max_keys, field_value::number},
    {"max_image_size", "Image size", system_limits_get_max_image_size, field_value::number},
    {"zip_max_filesize", "Archived file size", system_limits_get_zip_max_filesize,
     field_value::number},
    {"zip_max_total_filesize", "Archive size", system_limits_get_zip_max_total_filesize,
     field_value::number},
    {"folder_content_chunk_size", "Folder content chunk",
     system_limits_get_folder_content_chunk_size, field_value::number},
    {"folder_depth_limit", "Folder depth", system_limits_get_folder_depth_limit,
     field_value::number},
    {"limit_search_results", "Search results", system_limits_get_limit_search_results,
     field_value::number},
    {"daily_shares_limit", "Shares per day", system_limits_get_daily_shares_limit,
     field_value::number},
    {"device_changes_list_limit", "Device change list", system_limits_get_device_changes_list_limit,
     field_value::number},
};

constexpr record_field<system_status> status_fields[] = {
    {"database", "Database", system_status_get_database},
    {"memcache", "Memory cache", system_status_get_memcache},
};

} // namespace

void run_status(command_context &context)
{
    system_status *record = nullptr;
    context.remote().read("reading the service's status", [&](char **error_message) {
        return get_system_status(&record, error_message);
    });
    const system_status_owner owned(record);
    context.output.facts(facts_of(record, status_fields));
}

void run_limits(command_context &context)
{
    system_limits *record = nullptr;
    context.remote().read("reading the service's limits", [&](char **error_message) {
        return get_system_limits(&record, error_message);
    });
    const system_limits_owner owned(record);
    context.output.facts(facts_of(record, limit_fields));
}

} // namespace quillmere::tools
