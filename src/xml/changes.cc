// The device change feed, read into a list of changes.
#include <utility>

#include "text/number.h"
#include "xml/extractor.h"

namespace quillmere {

namespace {

// What the feed's sections mean for the records inside them.
constexpr int32_t deleted = 0;
constexpr int32_t updated = 1;
constexpr int32_t in_files = 0;
constexpr int32_t in_folders = 1;

// Both kinds have their key in the same row: a record whose section changes under way goes on with
// the texts that it has.
constexpr element_field<change_info> change_elements[] = {
    {"quickkey", &change_info::key},      {"parent_folderkey", &change_info::parent_folderkey},
    {"created", &change_info::created},   {"filename", &change_info::filename},
    {"mimetype", &change_info::mimetype}, {"filetype", &change_info::filetype},
};

// The public state comes first, so that the exported callbacks can take the whole for it.
struct extraction {
    changes_state state;
    field_joiner<change_info, std::size(change_elements)> texts{change_elements};
};

// The table's name for the element whose text comes next. A folder's key has a name of its own, and
// of the rest a folder has nothing but the parent; for anything else the result is null.
const char *text_element(const changes_state &state)
{
    if (state.object_kind != in_folders)
        return state.current_element;
    if (is(state.current_element, "folderkey"))
        return "quickkey";
    return is(state.current_element, "parent_folderkey") ? state.current_element : nullptr;
}

uint64_t number_in(const char *text, int length)
{
    owned_buffer copy(string_new(0));
    string_append_len(copy.get(), text, static_cast<uint64_t>(length));
    return uint64_in(string_get(copy.get()));
}

template <class Joiner>
void add_text(changes_state &state, Joiner &&texts, const char *text, int length)
{
    if (!state.in_object || !state.current_element)
        return;
    change_info &change = *state.current_change;
    // The last piece of a revision decides, deliberately: unlike texts, pieces are not joined.
    if (is(state.current_element, "revision"))
        change.revision = number_in(text, length);
    const char *element = text_element(state);
    if (!element)
        return;
    // The kind of key tells a file from a folder, and each is only looked for in its own section.
    if (is(element, "quickkey"))
        change.is_folder = state.object_kind;
    texts.append(change, element, text, length);
}

void extract_text(void *user_data, const char *text, int length)
{
    auto *running = static_cast<extraction *>(user_data);
    add_text(running->state, running->texts, text, length);
}

bool starts_record(const char *element) { return is(element, "file") || is(element, "folder"); }

void enter_section(changes_state &state, const char *element)
{
    if (is(element, "updated"))
        state.change_type = updated;
    if (is(element, "deleted"))
        state.change_type = deleted;
    if (is(element, "files"))
        state.object_kind = in_files;
    if (is(element, "folders"))
        state.object_kind = in_folders;
}

void start_record(changes_state &state)
{
    if (state.in_object) {
        qm_printf("simple_extract_changes: Attempt to create object in object!\n");
        XML_StopParser(static_cast<XML_Parser>(state.parser), XML_FALSE);
        return;
    }
    state.current_change = change_info_new(nullptr, nullptr, nullptr, 0, state.object_kind,
                                           state.change_type, nullptr, nullptr, nullptr);
    state.in_object = 1;
}

// expat still reports the end of an empty element whose start stopped it; nothing is finished by
// that.
bool stopped(const changes_state &state)
{
    XML_ParsingStatus status = {XML_PARSING, XML_FALSE};
    XML_GetParsingStatus(static_cast<XML_Parser>(state.parser), &status);
    return status.parsing == XML_FINISHED;
}

void finish_record(changes_state &state)
{
    if (!state.in_object || stopped(state))
        return;
    add_to_change_list(state.changes, std::exchange(state.current_change, nullptr));
    state.change_count += 1;
    state.in_object = 0;
}

} // namespace

} // namespace quillmere

using namespace quillmere;

uint32_t simple_extract_changes(const char *xml, uint64_t length, change_list *changes,
                                uint32_t *change_count)
{
    if (!xml || length == 0)
        return 0;

    extraction running = {};
    running.state.changes = changes;
    // Logged before and after, deliberately.
    qm_printf("xml extract: num changes: %d\n", running.state.change_count);
    xml_parser parser =
        new_document_parser(&running, {simple_extract_changes_node_value_start,
                                       simple_extract_changes_node_value_end, extract_text});
    running.state.parser = parser.get();
    XML_Status status = parse_document(parser, xml, length);

    forget_element(&running.state.current_element);
    if (running.state.in_object)
        change_info_delete(&running.state.current_change);
    qm_printf("xml extract: num changes: %d\n", running.state.change_count);
    *change_count = static_cast<uint32_t>(running.state.change_count);
    return status == XML_STATUS_OK ? 0 : 1;
}

void simple_extract_changes_node_value_start(void *state, const char *element, const char **)
{
    auto *feed = static_cast<changes_state *>(state);
    enter_section(*feed, element);
    if (starts_record(element))
        start_record(*feed);
    remember_element(&feed->current_element, element);
}

void simple_extract_changes_node_value_end(void *state, const char *element)
{
    auto *feed = static_cast<changes_state *>(state);
    if (starts_record(element))
        finish_record(*feed);
    forget_element(&feed->current_element);
}

void simple_extract_changes_node_value_data(void *state, const char *text, int32_t length)
{
    add_text(*static_cast<changes_state *>(state), measuring_joiner(change_elements), text, length);
}
