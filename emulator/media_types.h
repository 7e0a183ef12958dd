// What kind of file a name promises.
#pragma once

#include <string_view>

namespace emulator {

struct media_type {
    const char *extension; // in lower case
    const char *file_type; // "image", "audio", "video", "text", "document", "archive", "other"
    const char *mime_type;

    bool is(std::string_view type) const { return type == file_type; }
};

/** By the extension, whose letter case does not matter. */
const media_type &media_type_of(std::string_view name);

} // namespace emulator
