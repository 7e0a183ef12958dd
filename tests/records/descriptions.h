// Records and lists in a form that tests can compare whole: each field that a record has, in the
// order of the constructor's arguments.
#pragma once

#include <string>
#include <vector>

#include "records/record_kinds.h"

namespace quillmere_test {

// Such as "quickkey=abc filename=a.txt". Fields without a text are left out; those with an empty
// one are not.
template <class Record> std::string texts_in(const Record *record)
{
    std::string texts;
    for (const auto &field : record_kind<Record>::texts) {
        const char *text = field.get(record);
        if (text)
            texts += (texts.empty() ? "" : " ") + std::string(field.name) + "=" + text;
    }
    return texts;
}

template <class Record> std::string description_of(const Record *record)
{
    return record ? texts_in(record) : "no record";
}

// A change's numbers always count: "12 updated file: key=abc".
inline std::string description_of(const change_info *record)
{
    if (!record)
        return "no record";
    auto kind = [](int32_t number, const char *zero, const char *one) {
        return number == 0 ? zero : number == 1 ? one : "neither";
    };
    return std::to_string(change_info_get_revision(record)) + " " +
           kind(change_info_get_changetype(record), "deleted", "updated") + " " +
           kind(change_info_get_is_folder(record), "file", "folder") + ": " + texts_in(record);
}

// From the node behind the first one to the end.
template <class List> std::vector<std::string> descriptions_of(const List *list)
{
    std::vector<std::string> descriptions;
    for (const List *node = list->next; node; node = node->next)
        descriptions.push_back(description_of(node->record));
    return descriptions;
}

} // namespace quillmere_test
