// What a device that keeps a copy of the account asks.
#include <limits>

#include "endpoints/endpoints.h"
#include "endpoints/entries.h"
#include "errors.h"
#include "media_types.h"
#include "store/accounts.h"
#include "store/database.h"
#include "store/feed.h"
#include "system_limits.h"
#include "text.h"
#include "times.h"

namespace emulator {
namespace {

void require_device_id(const call &asked)
{
    asked.required("device_id");
    check_device_id(asked);
}

// A revision that the account has not reached belongs to an earlier life of it.
std::uint64_t revision_given(const call &asked)
{
    const auto largest = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    const auto revision = parse_decimal(asked.required("revision"), largest);
    if (!revision || *revision > account_revision(asked.state.store, asked.account))
        throw refusal(error::parameter_invalid, "revision");
    return *revision;
}

enum class entry_detail { place, all };

void write_entry(const char *element, const char *key_element, const feed_entry &entry,
                 entry_detail detail, xml_writer &xml)
{
    xml.open(element);
    xml.element(key_element, entry.key);
    xml.element("revision", entry.revision);
    xml.element("parent_folderkey", entry.parent_key);
    if (detail == entry_detail::all) {
        const media_type &type = media_type_of(entry.name);
        xml.element("created", time_text(entry.created));
        xml.element("filename", entry.name);
        xml.element("mimetype", type.mime_type);
        xml.element("filetype", type.file_type);
    }
    xml.close();
}

void write_files(const std::vector<feed_entry> &entries, entry_detail detail, xml_writer &xml)
{
    if (entries.empty())
        return;
    xml.open("files");
    for (const feed_entry &each : entries)
        write_entry("file", "quickkey", each, detail, xml);
    xml.close();
}

void write_folders(const std::vector<feed_entry> &entries, xml_writer &xml)
{
    if (entries.empty())
        return;
    xml.open("folders");
    for (const feed_entry &each : entries)
        write_entry("folder", "folderkey", each, entry_detail::place, xml);
    xml.close();
}

} // namespace

void get_device_status(const call &asked, xml_writer &xml)
{
    require_device_id(asked);
    xml.element("device_revision", account_revision(asked.state.store, asked.account));
    // Every change is finished before its request is answered.
    xml.element("async_jobs_in_progress", "no");
}

void get_device_changes(const call &asked, xml_writer &xml)
{
    constexpr std::uint64_t block_size = system_limits::device_changes_list_limit;
    require_device_id(asked);
    const feed_block block = read_feed(asked.state.store, asked.account, revision_given(asked),
                                       static_cast<std::int64_t>(block_size));
    xml.open("updated");
    write_folders(block.updated_folders, xml);
    write_files(block.updated_files, entry_detail::all, xml);
    xml.close();
    xml.open("deleted");
    write_files(block.deleted_files, entry_detail::place, xml);
    write_folders(block.deleted_folders, xml);
    xml.close();
    xml.element("device_revision", block.reached);
    xml.element("changes_list_block", block_size);
}

} // namespace emulator
