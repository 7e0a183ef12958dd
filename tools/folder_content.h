// The whole of a folder's listing, which the service gives in chunks.
#pragma once

#include <vector>

#include "account.h"

namespace quillmere::tools {

/** What a folder holds, each entry once, in the service's order. */
struct folder_content {
    std::vector<const folder_info *> folders;
    std::vector<const file_info *> files;
    std::vector<folder_list_owner> folder_chunks; ///< own the records
    std::vector<file_list_owner> file_chunks;     ///< likewise
};

folder_content read_content(const account &owner, const remote_entry &folder,
                            const std::vector<entry_kind> &wanted);

} // namespace quillmere::tools
