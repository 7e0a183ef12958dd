// The error number and message of a refusal.
#include "owned.h"
#include "text/number.h"

using namespace quillmere;

void get_error_from_xml(const char *xml, uint64_t length, int32_t *error_code, char **error_message)
{
    int32_t parse_failed = 0;
    heap_text number(simple_get_xml_node_value(xml, length, "/error", &parse_failed));

    if (error_code) {
        if (number)
            *error_code = error_number_in(number.get());
        else
            *error_code = parse_failed ? QM_MALFORMED_REPLY : QM_UNUSABLE_ERROR_NUMBER;
    }
    if (!error_message)
        return;
    if (parse_failed) {
        *error_message = string_dup("Error parsing XML when trying to get error text");
    } else {
        int32_t ignored = 0;
        *error_message = simple_get_xml_node_value(xml, length, "/message", &ignored);
    }
}
