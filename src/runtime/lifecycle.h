// What starting the library sets up for the transfers.
#pragma once

#include "quillmere.h"

namespace quillmere {

struct event_handler_record {
    event_handler_function function;
    void *argument;
};

// Null before api_global_init() and after api_global_cleanup().
extern event_handler_record *event_handler;

} // namespace quillmere
