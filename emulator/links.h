// Links to the bytes of files: how they are written, and what is served under them.
#pragma once

#include <string>
#include <string_view>

#include "service.h"
#include "store/file_entries.h"

namespace emulator {

enum class link_use { view, download, stream, one_time };

/** One row for each kind of link. */
struct link_kind {
    const char *element; // in replies, and as a link type in requests
    const char *folder;  // where its path begins
    link_use use;
    /** "audio", "video" or "text" for files of that type alone; empty for all. */
    const char *file_type;
    bool needs_session;
};

inline constexpr link_kind link_kinds[] = {
    {"view", "/view/", link_use::view, "", false},
    {"listen", "/listen/", link_use::stream, "audio", false},
    {"watch", "/watch/", link_use::stream, "video", false},
    {"normal_download", "/file/", link_use::download, "", false},
    {"direct_download", "/download/", link_use::download, "", false},
    {"edit", "/edit/", link_use::view, "text", true},
    {"one_time_download", "/once/", link_use::one_time, "", true},
};

/** The kind of link that a path belongs to, or null. */
const link_kind *link_kind_of(std::string_view path);

/** The whole link. */
std::string link_text(std::string_view origin, const link_kind &kind, std::string_view link_key,
                      std::string_view file_name);

/** Serves the bytes. Throws a refusal when it cannot. */
reply serve_link(const request &asked, const link_kind &kind, service &state);

} // namespace emulator
