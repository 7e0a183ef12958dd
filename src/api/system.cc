// The state of the service and of the caller's device.
#include "api/api_call.h"
#include "text/number.h"

using namespace quillmere;

const char *get_system_limits_uri = "/api/system/get_limits.php";
const char *get_system_status_uri = "/api/system/get_status.php";
const char *get_device_status_uri = "/api/device/get_status.php";

namespace {

constexpr element_field<system_limits> limits_elements[] = {
    {"max_objects", &system_limits::max_objects},
    {"max_keys", &system_limits::max_keys},
    {"max_image_size", &system_limits::max_image_size},
    {"zip_max_filesize", &system_limits::zip_max_filesize},
    {"zip_max_total_filesize", &system_limits::zip_max_total_filesize},
    {"folder_content_chunk_size", &system_limits::folder_content_chunk_size},
    {"folder_depth_limit", &system_limits::folder_depth_limit},
    {"limit_search_results", &system_limits::limit_search_results},
    {"daily_shares_limit", &system_limits::daily_shares_limit},
    {"device_changes_list_limit", &system_limits::device_changes_list_limit},
};

constexpr element_field<system_status> status_elements[] = {
    {"database", &system_status::database},
    {"memcache", &system_status::memcache},
};

constexpr const char *device_elements[] = {"device_revision", "async_jobs_in_progress"};

constexpr auto limits_reply = index_of(standard_elements, limits_elements);
constexpr auto status_reply = index_of(standard_elements, status_elements);
constexpr auto device_reply = index_of(standard_elements, device_elements);

} // namespace

int32_t get_system_limits(system_limits **limits, char **error_message)
{
    *limits = nullptr;
    api_call call(get_system_limits_uri, error_message);

    call.expect(limits_reply);
    call.fetch("get_system_limits url: ", reply_log::text);
    if (call.accepted())
        *limits = call.record_of(limits_elements).release();
    return call.status();
}

int32_t get_system_status(system_status **status, char **error_message)
{
    *status = nullptr;
    api_call call(get_system_status_uri, error_message);

    call.expect(status_reply);
    call.fetch("get_system_status url: ", reply_log::text);
    if (call.accepted())
        *status = call.record_of(status_elements).release();
    return call.status();
}

int32_t get_device_status(const char *session_token, uint32_t device_id, uint64_t *device_revision,
                          int32_t *async_jobs_in_progress, char **error_message)
{
    *device_revision = 0;
    *async_jobs_in_progress = 0;
    api_call call(get_device_status_uri, error_message);
    call.plain("?session_token=", session_token);
    call.number("&device_id=", device_id);
    call.version();

    call.expect(device_reply);
    call.fetch("get_status url: ", reply_log::text);
    if (call.accepted()) {
        if (heap_text revision = call.text_of("device_revision"))
            *device_revision = uint64_in(revision.get());
        if (is_yes(call.text_of("async_jobs_in_progress").get()))
            *async_jobs_in_progress = 1;
    }
    return call.status();
}
