#include "uploader.h"

#include <charconv>

#include <quillmere.h>

#include "../console.h"
#include "upload.h"

namespace quillmere::tools {

namespace {

std::string text_of(char *text)
{
    const heap_text owned(text);
    return text == nullptr ? "" : text;
}

std::uint64_t revision_of(const remote_file &file)
{
    std::uint64_t revision = 0;
    const char *const end = file.revision.data() + file.revision.size();
    const auto [stop, problem] = std::from_chars(file.revision.data(), end, revision);
    if (problem != std::errc() || stop != end)
        throw failure(exit_code::unreadable_answer,
                      "the service did not tell the revision of " + file.name,
                      "run it again with --verbose to see the answer");
    return revision;
}

bool has_bytes_of(const remote_file &file, const local_source &from)
{
    return file.has_content && file.content.size == from.size &&
           file.content.sha256 == hex_of(from.digest);
}

} // namespace

uploader::uploader(const account &owner, const settings &chosen, bool quiet)
    : owner_(owner), chosen_(chosen), route_(upload_route_of(chosen)),
      style_(progress_style_for(quiet))
{
    if (route_ == upload_route::plain)
        note("uploads go to the unencrypted address " + chosen.emulator->plain_base +
             " on this machine");
}

transferred uploader::put(const local_source &from, remote_folder &into, const std::string &name)
{
    if (const remote_file *const there = into.file(name))
        return revise(from, *there, into.path_of(name));
    std::string url =
        text_of(get_upload_url(owner_.session(), nullptr, route_ == upload_route::tls ? 1 : 0));
    if (!into.entry().is_root())
        url += "&folder_key=" + into.entry().key;
    return {outcome::created, from.path, into.path_of(name), send(from, url, name), from.size};
}

transferred uploader::revise(const local_source &from, const remote_file &to,
                             const std::string &path)
{
    if (has_bytes_of(to, from))
        return {outcome::unchanged, from.path, path, to.key, from.size};
    const std::string url = text_of(get_patch_upload_url(
        owner_.session(), to.key.c_str(), revision_of(to), hex_of(from.digest).c_str(), from.size,
        route_ == upload_route::tls ? 1 : 0));
    send(from, url, to.name);
    return {outcome::revised, from.path, path, to.key, from.size};
}

std::string uploader::send(const local_source &from, const std::string &url,
                           const std::string &name)
{
    std::string key;
    progress shown(style_, name, from.size, 0);
    const upload asked = {url,
                          route_ == upload_route::tls,
                          chosen_.timeout_seconds,
                          name,
                          from.file.number(),
                          from.size,
                          from.digest,
                          [&shown](std::uint64_t bytes) { shown.advance(bytes); }};
    owner_.remote.once("uploading " + from.path, [&](char **error_message) {
        return send_upload(asked, key, error_message);
    });
    shown.finish();
    return key;
}

} // namespace quillmere::tools
