#include "fetcher.h"

#include <algorithm>
#include <set>

#include "../folder_content.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

/** Sees to it that no entry of a folder takes the place of another: names of attached folders may
 * be those of others. */
class names_in_use {
public:
    void take(const std::string &name, const std::string &path)
    {
        check_local_name(name);
        if (!names_.insert(name).second)
            throw failure(exit_code::refused, "several entries are called " + path,
                          "get each by its key, key:KEY, under a name of its own");
    }

private:
    std::set<std::string> names_;
};

} // namespace

fetcher::fetcher(const account &owner, const settings &chosen, link_security security,
                 progress_style style, transfer_report &report)
    : owner_(owner), report_(report), contents_(owner, chosen, security, style)
{
}

void fetcher::get_file(const remote_file &file, const std::string &path, const local_folder &into,
                       const std::string &name)
{
    const wanted only = {file, path, name};
    if (is_there(only, into))
        return;
    contents_.ask_for_links({file.key});
    get(only, into);
}

void fetcher::get_folder(const remote_entry &folder, const std::string &path,
                         const local_folder &into)
{
    const folder_content content =
        read_content(owner_, folder, {entry_kind::folder, entry_kind::file});
    names_in_use names;
    for (const folder_info *each : content.folders)
        report_.attempt([&] {
            const std::string name = text_or_empty(folder_info_get_foldername(each));
            const std::string inner_path = path_below(path, name);
            names.take(name, inner_path);
            get_folder(
                {entry_kind::folder, text_or_empty(folder_info_get_folderkey(each)), name, {}},
                inner_path, into.enter(name));
        });
    std::vector<wanted> missing;
    for (const file_info *each : content.files)
        report_.attempt([&] {
            const remote_file file = remote_file_of(each);
            const wanted found = {file, path_below(path, file.name), file.name};
            names.take(found.name, found.path);
            if (!is_there(found, into))
                missing.push_back(found);
        });
    get_all(missing, into);
}

bool fetcher::is_there(const wanted &each, const local_folder &into)
{
    check_local_name(each.name);
    const std::string target = into.path_of(each.name);
    if (!each.file.has_content)
        throw failure(exit_code::refused, each.path + " has no content yet",
                      "give it some with: quillmere update");
    if (into.entry(each.name) == local_entry::folder)
        throw failure(exit_code::local_file, "there is a folder " + target + " already",
                      "give the file another name, or move the folder away");
    if (!into.has(each.name, each.file.content))
        return false;
    report_.add({outcome::unchanged, each.path, target, each.file.key, each.file.content.size});
    return true;
}

void fetcher::get_all(const std::vector<wanted> &files, const local_folder &into)
{
    constexpr std::size_t at_once = linked_content::links_at_once;
    for (std::size_t begin = 0; begin < files.size(); begin += at_once) {
        const std::size_t end = std::min(begin + at_once, files.size());
        std::vector<std::string> keys;
        for (std::size_t i = begin; i < end; ++i)
            keys.push_back(files[i].file.key);
        report_.attempt([&] { contents_.ask_for_links(keys); });
        for (std::size_t i = begin; i < end; ++i)
            report_.attempt([&] { get(files[i], into); });
    }
}

void fetcher::get(const wanted &each, const local_folder &into)
{
    contents_.require_link(each.file.key, each.path);
    partial_file partial(into.number(), each.file.content);
    contents_.bring(each.file.key, each.path, partial);
    partial.rename_to(each.name);
    report_.add({outcome::downloaded, each.path, into.path_of(each.name), each.file.key,
                 each.file.content.size});
}

} // namespace quillmere::tools
