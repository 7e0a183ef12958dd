// Owners for what the library hands out.
#pragma once

#include <memory>

#include <quillmere.h>

namespace quillmere::tools {

struct free_text {
    void operator()(char *text) const { api_free(text); }
};
using heap_text = std::unique_ptr<char, free_text>;

/** Releases a record through its own function, which takes the pointer's address. */
template <auto Delete> struct delete_record {
    template <class Record> void operator()(Record *record) const { Delete(&record); }
};
using system_limits_owner = std::unique_ptr<system_limits, delete_record<system_limits_delete>>;
using system_status_owner = std::unique_ptr<system_status, delete_record<system_status_delete>>;

} // namespace quillmere::tools
