#include "change_feed.h"

namespace quillmere::tools {

std::int32_t ask_for_changes(const char *session, std::uint64_t since, std::uint32_t device,
                             decltype(get_device_changes) *ask, change_block &read,
                             char **error_message)
{
    change_list *changes = nullptr;
    std::uint32_t count = 0;
    const std::int32_t status =
        ask(session, since, device, &read.revision, &changes, &count, &read.size, error_message);
    // After a malformed reply the list is gone already, though the pointer still leads there.
    if (status != QM_MALFORMED_REPLY)
        read.changes.reset(changes);
    return status;
}

change_block read_changes(const account &owner, std::uint64_t since, std::uint32_t device)
{
    change_block read;
    owner.remote.read("reading the changes", [&](char **error_message) {
        return ask_for_changes(owner.session(), since, device, get_device_changes, read,
                               error_message);
    });
    return read;
}

} // namespace quillmere::tools
