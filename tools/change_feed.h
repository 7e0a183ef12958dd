// The change feed block by block, as the service hands it out.
#pragma once

#include <cstdint>

#include "account.h"

namespace quillmere::tools {

struct change_block {
    std::uint64_t revision = 0; ///< up to which the changes reach
    change_list_owner changes;
    std::int32_t size = 0; ///< the most that a block holds
};

/** One exchange of the feed, by an operation of the library that has this shape. */
std::int32_t ask_for_changes(const char *session, std::uint64_t since, std::uint32_t device,
                             decltype(get_device_changes) *ask, change_block &read,
                             char **error_message);

/** What changed since a revision. There may be more as long as the revision grows. */
change_block read_changes(const account &owner, std::uint64_t since, std::uint32_t device);

} // namespace quillmere::tools
