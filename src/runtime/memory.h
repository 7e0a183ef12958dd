// Every allocation of the library's goes through here. What is handed to callers is released with
// free(), so all of it is malloc memory.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillmere {

// For where running out of memory has no result of its own: one line on standard error, then the
// end. Going on with a null pointer would be worse, and the log stream may itself need memory.
[[noreturn]] void out_of_memory();

void *allocate(uint64_t size);
void *allocate_zeroed(uint64_t size);
void *reallocate(void *memory, uint64_t size);

template <class Resource> Resource *allocate_zeroed()
{
    return static_cast<Resource *>(allocate_zeroed(sizeof(Resource)));
}

// For where running out of memory does have a result: these return null.
void *try_allocate_zeroed(uint64_t count, uint64_t size);
char *try_copy_text(const char *text);

} // namespace quillmere
