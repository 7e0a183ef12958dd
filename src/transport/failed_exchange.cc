#include "transport/failed_exchange.h"

#include <cstdio>

#include "runtime/memory.h"

namespace quillmere {

int32_t failed_exchange_status(int64_t response_code)
{
    return response_code < 1 ? QM_NO_RESPONSE : QM_UNUSABLE_RESPONSE;
}

heap_text failed_exchange_message(int64_t response_code)
{
    if (response_code < 1)
        return heap_text(string_dup("Response error: no server HTTP response code received"));

    constexpr size_t message_size = 64; // holds any number of this width
    heap_text message(static_cast<char *>(allocate_zeroed(message_size)));
    std::snprintf(message.get(), message_size,
                  "Response error: received server HTTP response code %d",
                  static_cast<int32_t>(response_code));
    return message;
}

} // namespace quillmere
