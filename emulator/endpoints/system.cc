// What the service as a whole allows, and how it is. Neither needs a session.
#include <iostream>

#include "endpoints/endpoints.h"
#include "store/database.h"
#include "system_limits.h"

namespace emulator {
namespace {

struct limit {
    const char *element;
    std::uint64_t value;
};

constexpr limit limits[] = {
    {"max_objects", system_limits::max_objects},
    {"max_keys", system_limits::max_keys},
    {"max_image_size", system_limits::max_image_size},
    {"zip_max_filesize", system_limits::zip_max_filesize},
    {"zip_max_total_filesize", system_limits::zip_max_total_filesize},
    {"folder_content_chunk_size", system_limits::folder_content_chunk_size},
    {"folder_depth_limit", system_limits::folder_depth_limit},
    {"limit_search_results", system_limits::limit_search_results},
    {"daily_shares_limit", system_limits::daily_shares_limit},
    {"device_changes_list_limit", system_limits::device_changes_list_limit},
};

bool store_answers(database &store)
{
    try {
        return store.prepare("SELECT count(*) FROM accounts").step();
    } catch (const store_error &problem) {
        std::cerr << "quillmere-emulator: " << problem.what() << std::endl;
        return false;
    }
}

} // namespace

void get_system_limits(const call &, xml_writer &xml)
{
    for (const limit &row : limits)
        xml.element(row.element, row.value);
}

void get_system_status(const call &asked, xml_writer &xml)
{
    xml.element("database", store_answers(asked.state.store) ? "live" : "down");
    // There is no cache that could fail: what is not in the store is nowhere.
    xml.element("memcache", "none");
}

} // namespace emulator
