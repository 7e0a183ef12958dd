// What the library's own text functions share beyond the exported ones.
#pragma once

#include "quillmere.h"

namespace quillmere {

// Makes the text longer by count bytes, which the caller fills in: returns where they start. The
// NUL behind them is already in place. The only place where a buffer's storage grows.
char *extend(string_buffer *buffer, uint64_t count);

} // namespace quillmere
