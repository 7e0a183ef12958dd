// What is done with folders, one's own and foreign ones.
#include "endpoints/descriptions.h"
#include "endpoints/endpoints.h"
#include "endpoints/entries.h"
#include "errors.h"
#include "store/attachments.h"
#include "store/database.h"
#include "store/names.h"
#include "store/trees.h"

namespace emulator {

void get_folder_info(const call &asked, xml_writer &xml)
{
    check_device_id(asked);
    const bool totals = yes_or_no(asked, "details", true);
    const folder shown = readable_folder(asked, "folder_key");
    xml.open("folder_info");
    describe_folder(asked, shown, {true, totals}, xml);
    xml.close();
}

void create_folder(const call &asked, xml_writer &xml)
{
    database &store = asked.state.store;
    std::string name = asked.required("foldername");
    check_name(name, "foldername");
    const folder parent = destination_folder(asked, "parent_key");
    if (yes_or_no(asked, "allow_duplicate_name", false))
        name = free_name(store, parent.id, name);
    const std::int64_t now = asked.state.now();
    const folder made = create_folder(store, parent, {name, now, time_given(asked, "mtime", now)});
    xml.element("folder_key", made.key);
}

void delete_folder(const call &asked, xml_writer &)
{
    delete_folder(asked.state.store, own_folder(asked, "folder_key"), asked.state.now());
}

void update_folder(const call &asked, xml_writer &)
{
    const folder target = own_folder(asked, "folder_key");
    const metadata_change change = change_given(asked, "foldername");
    update_folder(asked.state.store, target, change, yes_or_no(asked, "privacy_recursive", false));
}

void copy_folder(const call &asked, xml_writer &xml)
{
    const folder source = copyable_folder(asked, "folder_key_src");
    const folder destination = destination_folder(asked, "folder_key_dst");
    const folder made = copy_folder(asked.state.store, source, destination, asked.state.now());
    xml.element("new_folderkey", made.key);
}

void move_folder(const call &asked, xml_writer &)
{
    const folder source = own_folder(asked, "folder_key_src");
    move_folder(asked.state.store, source, destination_folder(asked, "folder_key_dst"));
}

void attach_foreign_folder(const call &asked, xml_writer &)
{
    asked.required("folder_key");
    const folder foreign = readable_folder(asked, "folder_key");
    if (foreign.deleted != 0)
        throw refusal(error::folder_unknown);
    if (foreign.is_root())
        throw refusal(error::is_root);
    if (foreign.account == asked.account)
        throw refusal(error::attachment_wrong, "it is not foreign");
    attach_folder(asked.state.store, asked.account, foreign, asked.state.now());
}

void detach_foreign_folder(const call &asked, xml_writer &)
{
    asked.required("folder_key");
    detach_folder(asked.state.store, asked.account, readable_folder(asked, "folder_key"));
}

} // namespace emulator
