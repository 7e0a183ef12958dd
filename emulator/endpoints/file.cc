// What is done with files.
#include "endpoints/descriptions.h"
#include "endpoints/endpoints.h"
#include "endpoints/entries.h"
#include "errors.h"
#include "store/database.h"
#include "store/names.h"

namespace emulator {
namespace {

bool ends_with(const std::string &text, const std::string &ending)
{
    return text.size() >= ending.size() &&
           text.compare(text.size() - ending.size(), ending.size(), ending) == 0;
}

// An extension that the name has already is not put there twice.
std::string with_extension(std::string name, const std::string &extension)
{
    if (extension.empty())
        return name;
    const std::string ending = extension.front() == '.' ? extension : "." + extension;
    return ends_with(name, ending) ? name : name + ending;
}

} // namespace

void get_file_info(const call &asked, xml_writer &xml)
{
    const file shown = readable_file(asked, asked.required("quick_key"));
    xml.open("file_info");
    describe_file(asked, shown, file_form::alone, xml);
    xml.close();
}

void create_file(const call &asked, xml_writer &xml)
{
    database &store = asked.state.store;
    const folder parent = destination_folder(asked, "parent_key");
    const bool is_named = !asked.optional("filename").empty();
    std::string name = with_extension(is_named ? asked.optional("filename") : "Untitled",
                                      asked.optional("file_extension"));
    check_name(name, "filename");
    if (!is_named) // nobody chose it, so nobody is told that it is taken
        name = free_name(store, parent.id, name);
    const std::int64_t now = asked.state.now();
    const file made = create_file(store, parent, {name, now, time_given(asked, "mtime", now)});
    xml.element("quickkey", made.key);
}

void delete_file(const call &asked, xml_writer &)
{
    delete_file(asked.state.store, own_file(asked, "quick_key"), asked.state.now());
}

void update_file(const call &asked, xml_writer &)
{
    const file target = own_file(asked, "quick_key");
    update_file(asked.state.store, target, change_given(asked, "filename"));
}

void copy_file(const call &asked, xml_writer &xml)
{
    const file source = copyable_file(asked);
    const folder destination = destination_folder(asked, "folder_key");
    const file made = copy_file(asked.state.store, source, destination, asked.state.now());
    xml.element("new_quickkey", made.key);
}

void move_file(const call &asked, xml_writer &)
{
    const file source = own_file(asked, "quick_key");
    move_file(asked.state.store, source, destination_folder(asked, "folder_key"));
}

} // namespace emulator
