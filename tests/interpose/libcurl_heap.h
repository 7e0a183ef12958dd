// The heap of libcurl, counted through libcurl's own hooks.
#pragma once

#include <cstdint>

namespace quillmere_test {

// Makes libcurl take its memory through us. Must be made before libcurl is started, and be gone
// after it was stopped; until then libcurl stays started itself.
class counted_libcurl_heap {
public:
    counted_libcurl_heap();
    ~counted_libcurl_heap();
    counted_libcurl_heap(const counted_libcurl_heap &) = delete;
    counted_libcurl_heap &operator=(const counted_libcurl_heap &) = delete;

    // Blocks that libcurl has taken, on whatever thread, and not given back.
    int64_t blocks_held() const;
};

} // namespace quillmere_test
