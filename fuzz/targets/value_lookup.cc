// The lookup of one element: a line that names it, then the reply.
#include "support/choices.h"
#include "support/library.h"
#include "support/reference_document.h"

namespace quillmere_fuzz {
namespace {

void try_lookup(std::string_view input)
{
    silence_log();
    choices chosen(input);
    std::string sought = chosen.line();
    std::string xml(chosen.rest());
    int32_t parse_failed = 77;
    owned_text found;
    within_budget(linear, input.size(), [&] {
        found.reset(
            simple_get_xml_node_value(xml.c_str(), xml.size(), sought.c_str(), &parse_failed));
    });
    if (xml.size() > most_bytes_to_compare)
        return;

    document reply = read_document(xml);
    expect(parse_failed == (reply.well_formed ? 0 : 1), "the lookup tells damage");
    expect(as_optional(found.get()) == look_up(reply, sought), "the lookup finds the text");
}

const known_target lookup("value_lookup", try_lookup);

} // namespace
} // namespace quillmere_fuzz
