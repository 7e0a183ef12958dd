#include "endpoints/descriptions.h"

#include "endpoints/entries.h"
#include "media_types.h"
#include "store/accounts.h"
#include "store/attachments.h"
#include "store/database.h"
#include "store/feed.h"
#include "store/listing.h"
#include "store/profiles.h"
#include "store/trees.h"
#include "times.h"

namespace emulator {
namespace {

// With the eyes of the account that asks, or of the owner if that one sees but what is public.
std::int64_t eyes_of(const call &asked, std::int64_t folder, std::int64_t owner)
{
    const std::int64_t viewer = viewer_of(asked, folder);
    return viewer != 0 ? viewer : owner;
}

std::string date_or_nothing(std::int64_t time) { return time != 0 ? time_text(time) : ""; }

const char *yes_if(bool is_so) { return is_so ? "yes" : "no"; }

// What kind of thing it is to the account that asks.
void describe_sharing(const call &asked, std::int64_t owner, bool shared, xml_writer &xml)
{
    const bool is_own = owner == asked.account;
    xml.element("flag", is_own ? "0" : "1");
    xml.element("shared_by_user", yes_if(is_own && shared));
    xml.element("permissions", is_own ? "write" : "read");
}

void describe_totals(const call &asked, const folder &shown, xml_writer &xml)
{
    const tree_totals totals = totals_of(asked.state.store, shown.id);
    xml.element("total_files", totals.files);
    xml.element("total_folders", totals.folders);
    xml.element("total_size", totals.size);
}

} // namespace

void describe_folder(const call &asked, const folder &shown, folder_elements which, xml_writer &xml)
{
    database &store = asked.state.store;
    const std::int64_t eyes = eyes_of(asked, shown.id, shown.account);
    const listing inside{shown.id, viewer_of(asked, shown.id)};
    const feed_view view = view_of(store, eyes, shown.key);
    const bool shared = is_shared(store, shown.id);
    xml.element("folderkey", shown.key);
    if (which.parent_key)
        xml.element("parent_folderkey", view.parent_key);
    xml.element("name", shown.name);
    xml.element("created", time_text(shown.created));
    xml.element("description", shown.description);
    xml.element("tags", shown.tags);
    xml.element("folder_count", count_folders(store, inside));
    xml.element("file_count", count_files(store, inside));
    if (which.totals) {
        describe_totals(asked, shown, xml);
        xml.element("byte_count", size_of_files(store, inside));
    }
    xml.element("revision", view.revision);
    xml.element("epoch", account_epoch(store, eyes));
    xml.element("shared", yes_if(shared));
    xml.element("owner_name", owner_name(store, shown.account));
    xml.element("delete_date", date_or_nothing(shown.deleted));
    xml.element("custom_url", "");
    xml.element("dropbox_enabled", "no");
    describe_sharing(asked, shown.account, shared, xml);
    xml.element("avatar", "");
    xml.element("privacy", shown.privacy);
}

void describe_file(const call &asked, const file &shown, file_form form, xml_writer &xml)
{
    database &store = asked.state.store;
    const bool is_alone = form == file_form::alone;
    const media_type &type = media_type_of(shown.name);
    const feed_view view = view_of(store, eyes_of(asked, shown.folder, shown.account), shown.key);
    xml.element("quickkey", shown.key);
    if (is_alone)
        xml.element("parent_folderkey", view.parent_key);
    xml.element("filename", shown.name);
    xml.element("created", time_text(shown.created));
    xml.element("downloads", shown.downloads);
    xml.element(is_alone ? "description" : "desc", shown.description);
    xml.element("tags", shown.tags);
    xml.element("size", shown.content.size);
    xml.element("privacy", shown.privacy);
    xml.element("filetype", type.file_type);
    xml.element("mimetype", type.mime_type);
    xml.element("hash", shown.content.hash);
    xml.element("delete_date", date_or_nothing(shown.deleted));
    xml.element("password_protected", "no");
    xml.element("revision", view.revision);
    xml.element("owner_name", owner_name(store, shown.account));
    describe_sharing(asked, shown.account, is_shared(store, shown.folder), xml);
}

} // namespace emulator
