// Makes records from lists of texts, so that one test can serve every kind.
#pragma once

#include <gtest/gtest.h>

#include <array>
#include <memory>
#include <string>
#include <utility>

#include "records/record_kinds.h"

namespace quillmere_test {

template <class Kind>
constexpr size_t text_count = sizeof Kind::texts / sizeof(text_field<typename Kind::record>);

template <class Kind> using texts_of = std::array<const char *, text_count<Kind>>;

template <class Kind, size_t... Index>
typename Kind::record *make_from(const texts_of<Kind> &texts, std::index_sequence<Index...>)
{
    return Kind::create(texts[Index]...);
}

// A record with these texts; numbers, where a kind has any, are all different.
template <class Kind> typename Kind::record *make_record(const texts_of<Kind> &texts)
{
    return make_from<Kind>(texts, std::make_index_sequence<text_count<Kind>>());
}

using change_kind = record_kind<change_info>;

template <> inline change_info *make_record<change_kind>(const texts_of<change_kind> &texts)
{
    return change_info_new(texts[0], texts[1], texts[2], 7, 1, 2, texts[3], texts[4], texts[5]);
}

struct record_destroyer {
    template <class Record> void operator()(Record *record) const
    {
        record_kind<Record>::destroy(&record);
    }
};
template <class Kind> using owned_record = std::unique_ptr<typename Kind::record, record_destroyer>;

// The texts of a test: each is the name of its field.
template <class Kind> texts_of<Kind> names_of_fields()
{
    texts_of<Kind> texts = {};
    for (size_t index = 0; index < texts.size(); ++index)
        texts[index] = Kind::texts[index].name;
    return texts;
}

// Every kind, for the tests that hold for all of them.
using record_kinds =
    testing::Types<record_kind<file_info>, record_kind<folder_info>, record_kind<user_info>,
                   record_kind<user_limits>, record_kind<system_limits>, record_kind<system_status>,
                   record_kind<change_info>, record_kind<file_links>>;

class record_names {
public:
    template <class Kind> static std::string GetName(int index)
    {
        static const char *const names[] = {"file_info",   "folder_info",   "user_info",
                                            "user_limits", "system_limits", "system_status",
                                            "change_info", "file_links"};
        return names[index];
    }
};

} // namespace quillmere_test
