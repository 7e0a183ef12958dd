// Facts from a record of the library, by a table of its fields.
#pragma once

#include <cstddef>
#include <vector>

#include "results.h"
#include "text.h"

namespace quillmere::tools {

/** How a text that the service sent is told. A name that consists of digits stays a text. */
enum class field_value { text, number };

template <class Record> struct record_field {
    const char *key;
    const char *label; ///< null for a field that is told to scripts alone
    const char *(*get)(const Record *record);
    field_value value = field_value::text;
};

template <class Record, std::size_t Count>
std::vector<fact> facts_of(const Record *record, const record_field<Record> (&fields)[Count])
{
    std::vector<fact> facts;
    facts.reserve(Count);
    for (const auto &field : fields) {
        const char *const sent = field.get(record);
        facts.push_back(
            {field.key, field.label,
             field.value == field_value::number ? number_or_text(sent) : text_or_null(sent)});
    }
    return facts;
}

} // namespace quillmere::tools
