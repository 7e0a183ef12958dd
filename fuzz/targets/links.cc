// The links of files.
#include <memory>

#include "support/library.h"
#include "support/reference_records.h"

namespace quillmere_fuzz {
namespace {

std::vector<field_texts> read_links(const document &reply)
{
    std::vector<field_texts> read;
    std::optional<field_texts> open;
    std::optional<std::string> element;
    for (const event &each : reply.events) {
        if (each.what == happening::start) {
            if (each.text == "link")
                open.emplace();
            element = each.text;
        } else if (each.what == happening::end) {
            if (each.text == "link" && open) {
                read.push_back(*open);
                open.reset();
            }
            element.reset();
        } else if (open && element && field_for<file_links>(*element, {}, {})) {
            (*open)[*element] += each.text;
        }
    }
    return read;
}

using owned_links = std::unique_ptr<file_links_list, void (*)(file_links_list *)>;

void try_links(std::string_view input)
{
    silence_log();
    std::string xml(input);
    owned_links links(file_links_list_new(),
                      [](file_links_list *list) { delete_all_file_links_list(&list); });
    int32_t count = 0;
    uint32_t parse_failed = 77;
    within_budget(listed, input.size(), [&] {
        parse_failed = simple_extract_file_links(xml.c_str(), xml.size(), links.get(), &count);
    });
    expect(length_of(links.get()) == count, "as many links as are counted");
    if (xml.size() > most_bytes_to_compare)
        return;

    document reply = read_document(xml);
    expect(parse_failed == (reply.well_formed ? 0 : 1), "the links tell damage");
    expect(records_in(links.get()) == read_links(reply), "the links");
}

const known_target links("links", try_links);

} // namespace
} // namespace quillmere_fuzz
