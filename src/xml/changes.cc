// The device change feed, read into a list of changes.
#include <cstring>
#include <utility>

#include "text/number.h"
#include "xml/extractor.h"
#include "xml/list_extraction.h"

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

// The other elements that a feed is read by. Their rows, in the same order, come first in its
// index.
constexpr const char *other_elements[] = {"file",  "folder",  "updated",  "deleted",
                                          "files", "folders", "revision", "folderkey"};
enum row {
    file_row,
    folder_row,
    updated_row,
    deleted_row,
    files_row,
    folders_row,
    revision_row,
    folder_key_row,
    first_text_row, // of change_elements
    key_row = first_text_row,
    parent_row
};
constexpr auto feed_index = index_of(other_elements, change_elements);

// The public state comes first, so that the exported callbacks can take the whole for it.
struct extraction {
    changes_state state;
    field_joiner<change_info, std::size(change_elements)> texts{change_elements};
};

// The table's name for an element whose text comes next. A folder's key has a name of its own, and
// of the rest a folder has nothing but the parent; for anything else the result is null.
const char *text_element(const char *element, int32_t object_kind)
{
    if (object_kind != in_folders)
        return element;
    if (is(element, "folderkey"))
        return "quickkey";
    return is(element, "parent_folderkey") ? element : nullptr;
}

// The same as text_element(), by row.
uint8_t text_row(uint8_t row, int32_t object_kind)
{
    if (object_kind != in_folders)
        return row;
    if (row == folder_key_row)
        return key_row;
    return row == parent_row ? row : element_table::no_row;
}

uint64_t number_in(const char *text, int length)
{
    // Any number that makes sense fits in here, without a trip to the heap.
    char digits[32] = "";
    if (length < static_cast<int>(sizeof digits)) {
        std::memcpy(digits, text, static_cast<size_t>(length));
        return uint64_in(digits);
    }
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
    const char *element = text_element(state.current_element, state.object_kind);
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

// Logged before and after, deliberately.
void log_count(int32_t change_count) { qm_printf("xml extract: num changes: %d\n", change_count); }

} // namespace

uint32_t changes_extraction::extract(const char *xml, uint64_t length, change_list *changes,
                                     uint32_t *change_count)
{
    if (!whole())
        return simple_extract_changes(xml, length, changes, change_count);
    log_count(0);
    log_count(changes_.count());
    *change_count = static_cast<uint32_t>(changes_.count());
    changes_.move_to(changes);
    return 0;
}

bool changes_extraction::start(const element_name &element)
{
    stop_text();
    uint8_t row = feed_index.table().find(element);
    switch (row) {
    case file_row:
    case folder_row:
        return start_record();
    case updated_row:
    case deleted_row:
        change_type_ = row == updated_row ? updated : deleted;
        return true;
    case files_row:
    case folders_row:
        object_kind_ = row == files_row ? in_files : in_folders;
        return true;
    default:
        if (change_)
            lead_text(row);
        return true;
    }
}

// A record within a record stops the reading. What that means is for the exported extractor to say.
bool changes_extraction::start_record()
{
    if (change_)
        return false;
    change_ = new_record<change_info>();
    change_->is_folder = object_kind_;
    change_->changetype = change_type_;
    return true;
}

void changes_extraction::lead_text(uint8_t row)
{
    if (row == revision_row)
        meaning_ = meaning::revision;
    row = text_row(row, object_kind_);
    if (row < first_text_row || row == element_table::no_row)
        return;
    if (row == key_row)
        meaning_ = meaning::key;
    size_t field = row - first_text_row;
    target_ = {&((*change_).*change_elements[field].field), &texts_[field]};
}

void changes_extraction::end(const char *element)
{
    stop_text();
    if (change_ && starts_record(element))
        changes_.add(std::move(change_));
}

void changes_extraction::text(const char *piece, int length)
{
    if (meaning_ == meaning::revision)
        change_->revision = number_in(piece, length);
    if (meaning_ == meaning::key)
        change_->is_folder = object_kind_;
    target_.append(piece, length);
}

void changes_extraction::stop_text()
{
    target_ = {};
    meaning_ = meaning::none;
}

void changes_extraction::discard()
{
    changes_.clear();
    change_.reset();
}

} // namespace quillmere

using namespace quillmere;

uint32_t simple_extract_changes(const char *xml, uint64_t length, change_list *changes,
                                uint32_t *change_count)
{
    if (!xml || length == 0)
        return 0;

    extraction running = {};
    running.state.changes = changes;
    log_count(0);
    xml_parser parser =
        new_document_parser(&running, {simple_extract_changes_node_value_start,
                                       simple_extract_changes_node_value_end, extract_text});
    running.state.parser = parser.get();
    XML_Status status = parse_document(parser, xml, length);

    forget_element(&running.state.current_element);
    if (running.state.in_object)
        change_info_delete(&running.state.current_change);
    log_count(running.state.change_count);
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
