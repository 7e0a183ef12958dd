// The records that the extractors read, in the slow and straightforward way: each a map from the
// names of its fields to their texts.
#pragma once

#include <map>

#include "records/descriptions.h"
#include "support/reference_document.h"

namespace quillmere_fuzz {

using field_texts = std::map<std::string, std::string>;

// The fields that a record has, under the names of their accessors.
template <class Record> field_texts fields_of(const Record *record)
{
    field_texts fields;
    for (const auto &field : quillmere_test::record_kind<Record>::texts)
        if (const char *text = field.get(record))
            fields[field.name] = text;
    return fields;
}

// All records of a list in the order in which they were read, which is from its end to its start.
template <class List> std::vector<field_texts> records_in(const List *list)
{
    std::vector<field_texts> records;
    for (const List *node = list->next; node; node = node->next)
        records.insert(records.begin(), fields_of(node->record));
    return records;
}

// Where an element's text goes; names that are the same in both are left out of the tables.
using renamed = std::map<std::string, std::string>;

// Fields whose names no element has.
using unread = std::vector<std::string>;

// Whether a record of this kind takes the text of an element, and under which name.
template <class Record>
std::optional<std::string> field_for(const std::string &element, const renamed &names,
                                     const unread &never)
{
    auto other = names.find(element);
    std::string wanted = other == names.end() ? element : other->second;
    for (const std::string &each : never)
        if (wanted == each)
            return std::nullopt;
    for (const auto &[from, to] : names)
        if (wanted == to && element != from)
            return std::nullopt; // such as "type", which is written "filetype"
    for (const auto &field : quillmere_test::record_kind<Record>::texts)
        if (wanted == field.name)
            return wanted;
    return std::nullopt;
}

} // namespace quillmere_fuzz
