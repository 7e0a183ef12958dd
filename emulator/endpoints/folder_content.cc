// Listings, a chunk at a time.
#include <algorithm>
#include <limits>

#include "endpoints/descriptions.h"
#include "endpoints/endpoints.h"
#include "endpoints/entries.h"
#include "errors.h"
#include "store/database.h"
#include "store/listing.h"
#include "system_limits.h"
#include "text.h"

namespace emulator {
namespace {

constexpr auto chunk_size = static_cast<std::int64_t>(system_limits::folder_content_chunk_size);

/** What is asked for; without a word of it, folders and then files, as one sequence. */
struct content_type {
    bool folders;
    bool files;
};

content_type content_type_of(const call &asked)
{
    const std::string &text = asked.optional("content_type");
    if (text.empty())
        return {true, true};
    if (text != "folders" && text != "files")
        throw refusal(error::parameter_invalid, "content_type");
    return {text == "folders", text == "files"};
}

std::int64_t chunk_number(const call &asked)
{
    const std::string &text = asked.optional("chunk");
    if (text.empty())
        return 1;
    const auto number = parse_decimal(text, std::numeric_limits<std::uint32_t>::max());
    if (!number || *number == 0)
        throw refusal(error::parameter_invalid, "chunk");
    return static_cast<std::int64_t>(*number);
}

void write_folders(const call &asked, const std::vector<folder> &shown, xml_writer &xml)
{
    xml.open("folders");
    for (const folder &each : shown) {
        xml.open("folder");
        describe_folder(asked, each, {}, xml);
        xml.close();
    }
    xml.close();
}

void write_files(const call &asked, const std::vector<file> &shown, xml_writer &xml)
{
    xml.open("files");
    for (const file &each : shown) {
        xml.open("file");
        describe_file(asked, each, file_form::listed, xml);
        xml.close();
    }
    xml.close();
}

} // namespace

void get_folder_content(const call &asked, xml_writer &xml)
{
    database &store = asked.state.store;
    check_device_id(asked);
    const content_type type = content_type_of(asked);
    listing_part part{(chunk_number(asked) - 1) * chunk_size, chunk_size};
    const folder shown = readable_folder(asked, "folder_key");
    if (shown.deleted != 0)
        throw refusal(error::folder_unknown);
    const listing inside{shown.id, viewer_of(asked, shown.id)};

    xml.element("chunk_size", static_cast<std::uint64_t>(chunk_size));
    if (type.folders) {
        const std::vector<folder> folders = list_folders(store, inside, part);
        write_folders(asked, folders, xml);
        if (type.files) {
            // The files begin where the folders end.
            const auto all = static_cast<std::int64_t>(count_folders(store, inside));
            part.first = std::max<std::int64_t>(part.first - all, 0);
            part.count -= static_cast<std::int64_t>(folders.size());
        }
    }
    if (type.files)
        write_files(asked, list_files(store, inside, part), xml);
}

} // namespace emulator
