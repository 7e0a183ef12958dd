// The records as the rest of the library makes them: empty ones, filled in field by field.
#pragma once

#include "records/fields.h"
#include "runtime/memory.h"

namespace quillmere {

template <class Record> owned_record<Record> new_record()
{
    return owned_record<Record>(allocate_zeroed<Record>());
}

} // namespace quillmere
