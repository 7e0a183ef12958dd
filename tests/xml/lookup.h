// The value lookup in the form in which the tests want it.
#pragma once

#include <optional>
#include <string>

#include "quillmere.h"
#include "support/taken_text.h"

namespace quillmere_test {

struct looked_up {
    std::optional<std::string> value; // none for NULL
    int32_t parse_failed;
};

// The flag holds rubbish before the call, so that a test sees whether it is set.
inline looked_up look_up(const std::string &xml, const char *sought)
{
    int32_t parse_failed = 77;
    char *value = simple_get_xml_node_value(xml.data(), xml.size(), sought, &parse_failed);
    return {taken(value), parse_failed};
}

// The value alone, of a document that is well-formed.
inline std::optional<std::string> value_of(const std::string &xml, const char *sought)
{
    looked_up found = look_up(xml, sought);
    return found.parse_failed ? "the document is malformed" : found.value;
}

} // namespace quillmere_test
