// The device change feed, from the service or from a reply that is built in.
#include "api/api_call.h"
#include "api/sample_changes.h"
#include "text/number.h"

using namespace quillmere;

const char *get_device_changes_uri = "/api/device/get_changes.php";

namespace {

constexpr char url_heading[] = "get_changes url: ";

constexpr const char *feed_elements[] = {"device_revision", "changes_list_block"};
constexpr const char *sample_elements[] = {"device_revision", "recent_changes_limit"};

constexpr auto feed_reply = index_of(standard_elements, feed_elements);
constexpr auto sample_reply = index_of(standard_elements, sample_elements);

// What the feed and its sample have in common.
struct change_feed {
    uint64_t *device_revision;
    change_list **changes;
    uint32_t *change_count;
    int32_t *block_size;

    void reset() const
    {
        *device_revision = 0;
        *changes = nullptr;
        *change_count = 0;
        *block_size = 0;
    }

    void read(api_call &call, changes_extraction &entries, const char *block_size_element) const
    {
        *changes = change_list_new();
        call.extracted(entries.extract(call.reply(), call.reply_length(), *changes, change_count));
        if (heap_text revision = call.text_of("device_revision"))
            *device_revision = uint64_in(revision.get());
        if (heap_text size = call.text_of(block_size_element))
            *block_size = int32_in(size.get());
        // The sample too is malformed when expat has no memory to read it.
        if (call.malformed())
            delete_all_change_list(changes); // the pointer is left as it was, deliberately
    }
};

void changes_query(api_call &call, const char *session_token, uint64_t revision, uint32_t device_id)
{
    call.plain("?session_token=", session_token);
    call.number("&revision=", revision);
    call.number("&device_id=", device_id);
    call.version();
}

} // namespace

int32_t get_device_changes(const char *session_token, uint64_t revision, uint32_t device_id,
                           uint64_t *device_revision, change_list **changes, uint32_t *change_count,
                           int32_t *block_size, char **error_message)
{
    change_feed feed = {device_revision, changes, change_count, block_size};
    feed.reset();
    api_call call(get_device_changes_uri, error_message);
    changes_query(call, session_token, revision, device_id);

    changes_extraction entries;
    call.expect(feed_reply, &entries);
    call.fetch(url_heading, reply_log::text);
    if (call.accepted())
        feed.read(call, entries, "changes_list_block");
    return call.status();
}

int32_t test_get_device_changes(const char *session_token, uint64_t revision, uint32_t device_id,
                                uint64_t *device_revision, change_list **changes,
                                uint32_t *change_count, int32_t *block_size, char **error_message)
{
    change_feed feed = {device_revision, changes, change_count, block_size};
    feed.reset();
    api_call call(get_device_changes_uri, error_message);
    changes_query(call, session_token, revision, device_id);

    changes_extraction entries;
    call.expect(sample_reply, &entries);
    call.pretend(url_heading, sample_changes, sizeof sample_changes - 1);
    if (call.accepted())
        feed.read(call, entries,
                  "recent_changes_limit"); // which the sample does not have, deliberately
    return call.status();
}
