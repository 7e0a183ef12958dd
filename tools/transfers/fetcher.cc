#include "fetcher.h"

#include <algorithm>
#include <set>

#include <quillmere.h>

#include "../folder_content.h"

namespace quillmere::tools {

namespace {

constexpr std::size_t links_at_once = 100; // far below what the service and an address can take

std::string text_of(const char *text) { return text == nullptr ? "" : text; }

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

std::string joined_keys(const std::vector<std::string> &keys)
{
    std::string joined;
    for (const std::string &key : keys)
        joined += (joined.empty() ? "" : ",") + key;
    return joined;
}

std::string refusal_in(const file_links *record)
{
    std::string refusal;
    for (const char *each :
         {file_links_get_error(record), file_links_get_direct_download_error(record),
          file_links_get_direct_download_error_message(record)})
        if (each != nullptr)
            refusal += ": " + std::string(each);
    return refusal;
}

} // namespace

fetcher::fetcher(const account &owner, const settings &chosen, link_security security,
                 progress_style style, transfer_report &report)
    : owner_(owner), report_(report), style_(style), downloader_(security, chosen.timeout_seconds)
{
}

void fetcher::get_file(const remote_file &file, const std::string &path, const local_folder &into,
                       const std::string &name)
{
    const wanted only = {file, path, name};
    if (!is_there(only, into))
        get(only, links_of({only}), into);
}

void fetcher::get_folder(const remote_entry &folder, const std::string &path,
                         const local_folder &into)
{
    const folder_content content =
        read_content(owner_, folder, {entry_kind::folder, entry_kind::file});
    names_in_use names;
    for (const folder_info *each : content.folders)
        report_.attempt([&] {
            const std::string name = text_of(folder_info_get_foldername(each));
            const std::string inner_path = path_below(path, name);
            names.take(name, inner_path);
            get_folder({entry_kind::folder, text_of(folder_info_get_folderkey(each)), name, {}},
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
    for (std::size_t begin = 0; begin < files.size(); begin += links_at_once) {
        const std::size_t end = std::min(begin + links_at_once, files.size());
        const std::vector<wanted> some(files.begin() + static_cast<std::ptrdiff_t>(begin),
                                       files.begin() + static_cast<std::ptrdiff_t>(end));
        links known;
        report_.attempt([&] { known = links_of(some); });
        for (const wanted &each : some)
            report_.attempt([&] { get(each, known, into); });
    }
}

fetcher::links fetcher::links_of(const std::vector<wanted> &files)
{
    std::vector<std::string> keys;
    keys.reserve(files.size());
    for (const wanted &each : files)
        keys.push_back(each.file.key);
    const std::string key_text = joined_keys(keys);
    file_links_list *list = nullptr;
    owner_.remote.read("reading links", [&](char **error_message) {
        std::int32_t count = 0;
        return get_links(key_text.c_str(), "direct_download", owner_.session(), &list, &count,
                         error_message);
    });
    const file_links_list_owner owned(list);
    links known;
    for (const file_links *each : in_order_sent(list))
        known[text_of(file_links_get_quickkey(each))] = {
            text_of(file_links_get_direct_download(each)), refusal_in(each)};
    return known;
}

void fetcher::get(const wanted &each, const links &known, const local_folder &into)
{
    const auto found = known.find(each.file.key);
    if (found == known.end() || found->second.url.empty())
        throw failure(exit_code::refused,
                      "there is no download of " + each.path +
                          (found == known.end() ? "" : found->second.refusal),
                      "quillmere links tells which links it has");
    partial_file partial(into.number(), each.file.content);
    const bool resumed = partial.size() > 0;
    fetch(each, found->second.url, partial);
    bool right = partial.is_right();
    if (!right && resumed) { // the beginning may have been spoilt
        partial.restart();
        fetch(each, found->second.url, partial);
        right = partial.is_right();
    }
    if (!right) {
        partial.restart();
        throw failure(exit_code::unreadable_answer,
                      "the bytes that arrived are not those of " + each.path,
                      "the file may have changed meanwhile: try again");
    }
    partial.rename_to(each.name);
    report_.add({outcome::downloaded, each.path, into.path_of(each.name), each.file.key,
                 each.file.content.size});
}

void fetcher::fetch(const wanted &each, const std::string &url, partial_file &into)
{
    if (into.missing() == 0)
        return;
    const heap_text whole_url(normalize_url(url.c_str(), "http"));
    progress shown(style_, each.path, each.file.content.size, into.size());
    owner_.remote.read("downloading " + each.path, [&](char **error_message) {
        return downloader_.fetch(whole_url.get(), into, shown, error_message);
    });
    shown.finish();
}

} // namespace quillmere::tools
