// The lookup of one element's text. Each lookup parses the whole reply with a state of its own.
#include <cstdio>
#include <cstring>

#include "xml/document.h"
#include "xml/joined_text.h"

namespace quillmere {

namespace {

// The public state comes first, so that the exported callbacks can take the whole for it.
struct lookup {
    node_value_state state;
    joined_text text;
};

void collect(void *user_data, const char *text, int length)
{
    auto *sought = static_cast<lookup *>(user_data);
    if (sought->state.collecting)
        sought->text.append(&sought->state.value, text, length);
}

void log_parse_failure(XML_Status status, const char *sought, const char *xml)
{
    qm_printf("Expat failed parsing a node with error %d\n", static_cast<int>(status));
    std::fflush(stdout);
    qm_printf("Name of node whose value is sought: %s\n", sought);
    std::fflush(stdout);
    qm_printf("XML we are searching for this node:\n%s\n", xml);
    std::fflush(stdout);
}

} // namespace

} // namespace quillmere

using namespace quillmere;

char *simple_get_xml_node_value(const char *xml, uint64_t length, const char *sought,
                                int32_t *parse_failed)
{
    *parse_failed = 0;
    if (!xml || length == 0)
        return nullptr;

    owned_buffer path(string_new(64));
    lookup state = {{sought, nullptr, 0, 0, path.get()}, {}};
    xml_parser parser = new_document_parser(
        &state, {simple_get_xml_node_value_start, simple_get_xml_node_value_end, collect});
    XML_Status status = parse_document(parser, xml, length);
    if (status != XML_STATUS_OK) {
        *parse_failed = 1;
        log_parse_failure(status, sought, xml);
    }
    return state.state.value;
}

void simple_get_xml_node_value_start(void *state, const char *element, const char **)
{
    auto *lookup = static_cast<node_value_state *>(state);
    lookup->depth += 1;
    if (lookup->depth > 1) {
        string_append(lookup->path, "/");
        string_append(lookup->path, element);
    }
    if (std::strcmp(lookup->sought, element) == 0)
        lookup->collecting = 1;
    if (std::strcmp(lookup->sought, string_get(lookup->path)) == 0)
        lookup->collecting = 1;
}

void simple_get_xml_node_value_end(void *state, const char *element)
{
    auto *lookup = static_cast<node_value_state *>(state);
    lookup->collecting = 0; // at any end tag, deliberately, not just at the sought element's
    if (lookup->depth > 1)
        string_reduce(lookup->path, std::strlen(element) + 1);
    lookup->depth -= 1;
}

void simple_get_xml_node_value_data(void *state, const char *text, int32_t length)
{
    auto *lookup = static_cast<node_value_state *>(state);
    if (lookup->collecting)
        node_value_data_accumulate(&lookup->value, text, length);
}
