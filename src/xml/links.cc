// The links of files, read into a list.
#include <utility>

#include "xml/extractor.h"
#include "xml/list_extraction.h"

namespace quillmere {

namespace {

constexpr element_field<file_links> link_elements[] = {
    {"quickkey", &file_links::quickkey},
    {"view", &file_links::view},
    {"listen", &file_links::listen},
    {"watch", &file_links::watch},
    {"normal_download", &file_links::normal_download},
    {"direct_download", &file_links::direct_download},
    {"direct_download_error_message", &file_links::direct_download_error_message},
    {"direct_download_error", &file_links::direct_download_error},
    {"edit", &file_links::edit},
    {"edit_error_message", &file_links::edit_error_message},
    {"one_time_download", &file_links::one_time_download},
    {"one_time_download_error_message", &file_links::one_time_download_error_message},
    {"error", &file_links::error},
};

constexpr auto link_index = index_of(link_elements);

// The public state comes first, so that the exported callbacks can take the whole for it.
struct extraction {
    links_state state;
    field_joiner<file_links, std::size(link_elements)> texts{link_elements};
};

// An element such as "error" may also stand beside the links, where no record takes it.
template <class Joiner>
void add_text(links_state &state, Joiner &&joiner, const char *text, int length)
{
    if (state.current_link && state.current_element)
        joiner.append(*state.current_link, state.current_element, text, length);
}

void extract_text(void *user_data, const char *text, int length)
{
    auto *running = static_cast<extraction *>(user_data);
    add_text(running->state, running->texts, text, length);
}

void log_link() { qm_printf("xml extract: found link\n"); }

void log_count(int32_t link_count) { qm_printf("xml extract: num_file_links %d\n", link_count); }

// An end tag may find no record open.
void finish_link(links_state &state)
{
    if (!state.current_link)
        return;
    add_to_file_links_list(state.links, std::exchange(state.current_link, nullptr));
    state.link_count += 1;
    state.in_link = 0;
    log_link();
}

} // namespace

uint32_t links_extraction::extract(const char *xml, uint64_t length, file_links_list *links,
                                   int32_t *link_count)
{
    if (!whole())
        return simple_extract_file_links(xml, length, links, link_count);
    for (int32_t link = 0; link < links_.count(); ++link)
        log_link();
    log_count(links_.count());
    *link_count = links_.count();
    links_.move_to(links);
    return 0;
}

bool links_extraction::start(const element_name &element)
{
    target_ = {};
    if (is(element.text, "link"))
        link_ = new_record<file_links>();
    else if (link_)
        target_ = text_target_of(*link_, link_elements, link_index, texts_, element);
    return true;
}

void links_extraction::end(const char *element)
{
    target_ = {};
    if (is(element, "link"))
        links_.add(std::move(link_));
}

void links_extraction::discard()
{
    links_.clear();
    link_.reset();
}

} // namespace quillmere

using namespace quillmere;

uint32_t simple_extract_file_links(const char *xml, uint64_t length, file_links_list *links,
                                   int32_t *link_count)
{
    if (!xml || length == 0)
        return 0;

    extraction running = {};
    running.state.links = links;
    xml_parser parser =
        new_document_parser(&running, {simple_extract_links_node_value_start,
                                       simple_extract_links_node_value_end, extract_text});
    XML_Status status = parse_document(parser, xml, length);

    log_count(running.state.link_count);
    *link_count = running.state.link_count;
    forget_element(&running.state.current_element);
    file_links_delete(&running.state.current_link);
    return status == XML_STATUS_OK ? 0 : 1;
}

void simple_extract_links_node_value_start(void *state, const char *element, const char **)
{
    auto *reply = static_cast<links_state *>(state);
    if (is(element, "link")) {
        file_links_delete(&reply->current_link);
        reply->current_link = new_record<file_links>().release();
        reply->in_link = 1;
    }
    remember_element(&reply->current_element, element);
}

void simple_extract_links_node_value_end(void *state, const char *element)
{
    auto *reply = static_cast<links_state *>(state);
    if (is(element, "link"))
        finish_link(*reply);
    forget_element(&reply->current_element);
}

void simple_extract_links_node_value_data(void *state, const char *text, int32_t length)
{
    add_text(*static_cast<links_state *>(state), measuring_joiner(link_elements), text, length);
}
