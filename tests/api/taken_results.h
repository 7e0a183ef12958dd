// What calls of operations start with and end in: out-parameters that hold rubbish, and everything
// that came out of them written down and released.
#pragma once

#include <string>

#include "api/account_calls.h"
#include "records/descriptions.h"

namespace quillmere_test {

// An address that no operation hands out.
inline char rubbish_byte;
template <class Pointed> Pointed *rubbish() { return reinterpret_cast<Pointed *>(&rubbish_byte); }
constexpr int32_t rubbish_number = -777;

template <class Pointed> bool untouched(const Pointed *result)
{
    return result == rubbish<Pointed>();
}

inline std::string as_text(const char *text) { return text ? text : "NULL"; }

// Writes a text result down and releases it.
inline std::string taken(const char *name, char *text)
{
    std::string result = std::string(name) + "=" + (untouched(text) ? "untouched" : as_text(text));
    if (!untouched(text))
        api_free(text);
    return result;
}

template <class Number> std::string taken_number(const char *name, Number number)
{
    return std::string(name) + "=" +
           (number == static_cast<Number>(rubbish_number) ? "untouched" : std::to_string(number));
}

template <class Record> std::string taken_record(Record *record)
{
    if (untouched(record))
        return "record=untouched";
    std::string result = record ? "record{" + description_of(record) + "}" : "record=NULL";
    record_kind<Record>::destroy(&record);
    return result;
}

template <auto DeleteAll, class List> std::string taken_list(const char *name, List *list)
{
    std::string result = name;
    if (untouched(list))
        return result + "=untouched";
    if (!list)
        return result + "=NULL";
    for (const std::string &description : descriptions_of(list))
        result += "{" + description + "}";
    DeleteAll(&list);
    return result == name ? result + "{}" : result;
}

inline std::string taken_changes(int32_t status, change_list *changes)
{
    if (status == QM_MALFORMED_REPLY && changes && !untouched(changes))
        return "changes=deleted";
    return taken_list<delete_all_change_list>("changes", changes);
}

inline call_outcome outcome_of(int32_t status, char *message, const std::string &results)
{
    call_outcome outcome = {status, std::nullopt, results};
    if (untouched(message))
        outcome.message = "untouched";
    else if (message)
        outcome.message = message;
    if (!untouched(message))
        api_free(message);
    return outcome;
}

} // namespace quillmere_test
