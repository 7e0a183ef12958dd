// What the list extractors share: each is a table of fields and a small state machine, and the rest
// is here.
#pragma once

#include <cstdlib>
#include <cstring>
#include <iterator>

#include "records/elements.h"
#include "records/records.h"
#include "xml/document.h"
#include "xml/joined_text.h"

namespace quillmere {

// Most names differ in their first byte, which costs no call to see.
inline bool is(const char *element, const char *name)
{
    return *element == *name && std::strcmp(element, name) == 0;
}

// Keeps a copy of the name of the element that started last, or, behind any end tag, none: text
// that follows a child belongs to nobody.
inline void remember_element(char **current_element, const char *element)
{
    std::free(*current_element);
    *current_element = string_dup(element);
}

inline void forget_element(char **current_element)
{
    std::free(*current_element);
    *current_element = nullptr;
}

// Appends pieces of text to the fields of a record that is being read, and remembers for each row
// of its table where the text ends.
template <class Record, size_t count> class field_joiner {
public:
    constexpr explicit field_joiner(const element_field<Record> (&table)[count]) : table_(table) {}

    // Elements that the table does not list are passed over.
    void append(Record &record, const char *element, const char *piece, int length)
    {
        size_t row = row_of(table_, element);
        if (row < count)
            texts_[row].append(&(record.*table_[row].field), piece, length);
    }

private:
    const element_field<Record> (&table_)[count];
    joined_text texts_[count];
};

// The same for the exported callbacks, which are handed nothing to remember in: it measures the
// text each time.
template <class Record, size_t count> class measuring_joiner {
public:
    constexpr explicit measuring_joiner(const element_field<Record> (&table)[count]) : table_(table)
    {
    }

    void append(Record &record, const char *element, const char *piece, int length) const
    {
        size_t row = row_of(table_, element);
        if (row < count)
            node_value_data_accumulate(&(record.*table_[row].field), piece, length);
    }

private:
    const element_field<Record> (&table_)[count];
};

} // namespace quillmere
