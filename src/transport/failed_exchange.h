// What an exchange without a usable reply amounts to, for operations and request objects alike.
#pragma once

#include "owned.h"

namespace quillmere {

// QM_NO_RESPONSE or QM_UNUSABLE_RESPONSE, by whether a response code arrived.
int32_t failed_exchange_status(int64_t response_code);

// The message that goes with it.
heap_text failed_exchange_message(int64_t response_code);

} // namespace quillmere
