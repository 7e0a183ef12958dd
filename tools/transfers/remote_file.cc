#include "remote_file.h"

#include <charconv>

#include "../folder_content.h"
#include "../remote_changes.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

std::uint64_t number_of(const std::string &text)
{
    std::uint64_t number = 0;
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number;
}

} // namespace

remote_file remote_file_of(const file_info *record)
{
    remote_file file;
    file.key = text_or_empty(file_info_get_quickkey(record));
    file.name = text_or_empty(file_info_get_filename(record));
    file.revision = text_or_empty(file_info_get_revision(record));
    file.content.size = number_of(text_or_empty(file_info_get_size(record)));
    file.content.sha256 = lower_case(text_or_empty(file_info_get_hash(record)));
    file.has_content = is_sha256_hex(file.content.sha256);
    return file;
}

const remote_file *remote_folder::file(const std::string &name)
{
    list();
    const auto found = files_.find(name);
    return found == files_.end() ? nullptr : &found->second;
}

remote_folder remote_folder::enter(const std::string &name)
{
    list();
    const auto found = folders_.find(name);
    if (found != folders_.end())
        return {owner_, found->second, path_of(name)};
    remote_folder made(owner_, create_folder_in(owner_, entry_, name), path_of(name));
    made.listed_ = true; // there is nothing in it
    return made;
}

void remote_folder::list()
{
    if (std::exchange(listed_, true))
        return;
    const folder_content content =
        read_content(owner_, entry_, {entry_kind::folder, entry_kind::file});
    for (const folder_info *each : content.folders) {
        const std::string name = text_or_empty(folder_info_get_foldername(each));
        folders_.emplace(name, remote_entry{entry_kind::folder,
                                            text_or_empty(folder_info_get_folderkey(each)), name,
                                            entry_.key});
    }
    for (const file_info *each : content.files) {
        remote_file file = remote_file_of(each);
        const std::string name = file.name;
        files_.emplace(name, std::move(file));
    }
}

} // namespace quillmere::tools
