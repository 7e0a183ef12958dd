// What the service tells of itself to anybody.

#include "commands.h"

#include <vector>

#include "../heap.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

template <class Record> struct record_field {
    const char *key;
    const char *label;
    const char *(*get)(const Record *record);
};

constexpr record_field<system_limits> limit_fields[] = {
    {"max_objects", "Objects", system_limits_get_max_objects},
    {"max_keys", "Keys", system_limits_get_max_keys},
    {"max_image_size", "Image size", system_limits_get_max_image_size},
    {"zip_max_filesize", "Archived file size", system_limits_get_zip_max_filesize},
    {"zip_max_total_filesize", "Archive size", system_limits_get_zip_max_total_filesize},
    {"folder_content_chunk_size", "Folder content chunk",
     system_limits_get_folder_content_chunk_size},
    {"folder_depth_limit", "Folder depth", system_limits_get_folder_depth_limit},
    {"limit_search_results", "Search results", system_limits_get_limit_search_results},
    {"daily_shares_limit", "Shares per day", system_limits_get_daily_shares_limit},
    {"device_changes_list_limit", "Device change list",
     system_limits_get_device_changes_list_limit},
};

constexpr record_field<system_status> status_fields[] = {
    {"database", "Database", system_status_get_database},
    {"memcache", "Memory cache", system_status_get_memcache},
};

template <class Record, std::size_t Count>
std::vector<fact> facts_of(const Record *record, const record_field<Record> (&fields)[Count])
{
    std::vector<fact> facts;
    for (const auto &field : fields)
        facts.push_back({field.key, field.label, number_or_text(field.get(record))});
    return facts;
}

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
