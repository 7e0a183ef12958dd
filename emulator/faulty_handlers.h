// The service's answers with the faults that a test asks for.
#pragma once

#include "faults.h"
#include "http_server.h"
#include "request_counts.h"

namespace emulator {

/**
 * The same handlers, with the faults between them and the client, and each request counted: when it
 * is whole, or an upload when its header is. The list and the counts must outlive the result.
 */
request_handlers with_faults(request_handlers inner, fault_list &faults, request_counts &counts);

} // namespace emulator
