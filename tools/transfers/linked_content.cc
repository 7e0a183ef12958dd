#include "linked_content.h"

#include <quillmere.h>

#include "../failure.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

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

linked_content::linked_content(const account &owner, const settings &chosen, link_security security,
                               progress_style style)
    : owner_(owner), style_(style), downloader_(security, chosen.timeout_seconds)
{
}

void linked_content::ask_for_links(const std::vector<std::string> &keys)
{
    links_.clear();
    const std::string key_text = joined_keys(keys);
    file_links_list *list = nullptr;
    owner_.remote.read("reading links", [&](char **error_message) {
        std::int32_t count = 0;
        return get_links(key_text.c_str(), "direct_download", owner_.session(), &list, &count,
                         error_message);
    });
    const file_links_list_owner owned(list);
    for (const file_links *each : in_order_sent(list))
        links_[text_or_empty(file_links_get_quickkey(each))] = {
            text_or_empty(file_links_get_direct_download(each)), refusal_in(each)};
}

const std::string &linked_content::require_link(const std::string &key,
                                                const std::string &path) const
{
    const auto found = links_.find(key);
    if (found == links_.end() || found->second.url.empty())
        throw failure(exit_code::refused,
                      "there is no download of " + path +
                          (found == links_.end() ? "" : found->second.refusal),
                      "quillmere links tells which links it has");
    return found->second.url;
}

void linked_content::bring(const std::string &key, const std::string &path, partial_file &partial)
{
    const std::string &url = require_link(key, path);
    const bool resumed = partial.size() > 0;
    fetch(url, path, partial);
    bool right = partial.is_right();
    if (!right && resumed) { // the beginning may have been spoilt
        partial.restart();
        fetch(url, path, partial);
        right = partial.is_right();
    }
    if (right)
        return;
    partial.restart();
    throw failure(exit_code::unreadable_answer, "the bytes that arrived are not those of " + path,
                  "the file may have changed meanwhile: try again");
}

void linked_content::fetch(const std::string &url, const std::string &path, partial_file &into)
{
    if (into.missing() == 0)
        return;
    const heap_text whole_url(normalize_url(url.c_str(), "http"));
    progress shown(style_, path, into.size() + into.missing(), into.size());
    owner_.remote.read("downloading " + path, [&](char **error_message) {
        return downloader_.fetch(whole_url.get(), into, shown, error_message);
    });
    shown.finish();
}

} // namespace quillmere::tools
