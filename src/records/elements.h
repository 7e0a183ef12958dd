// Tables that tie the elements of a reply to the fields of a record.
#pragma once

#include <cstddef>
#include <cstring>

namespace quillmere {

template <class Record> struct element_field {
    const char *element; // a name, or a path below the root
    char *Record::*field;
};

// The place of an element in a table, or the number of rows if it is not there.
template <class Record, size_t count>
size_t row_of(const element_field<Record> (&table)[count], const char *element)
{
    size_t row = 0;
    while (row < count && std::strcmp(table[row].element, element) != 0)
        ++row;
    return row;
}

} // namespace quillmere
