#include "state.h"

#include <cerrno>
#include <cstdio>

#include <fcntl.h>
#include <nlohmann/json.hpp>

#include "../descriptor.h"
#include "../failure.h"
#include "../transfers/local_folder.h"

namespace quillmere::tools {

namespace {

using nlohmann::json;

constexpr const char *file_name = "state.json";
constexpr const char *new_file_name = "state.json.new";
constexpr int format = 1;
constexpr std::size_t largest_state = std::size_t{1} << 30;
constexpr const char *advice = "move the folder .quillmere-mirror away to begin the mirror anew";

entry_kind kind_called(const std::string &word)
{
    return word == word_for(entry_kind::file) ? entry_kind::file : entry_kind::folder;
}

json json_of(const known_entry &entry)
{
    json object = {{"kind", word_for(entry.kind)},
                   {"parent", entry.parent},
                   {"name", entry.name},
                   {"described", entry.described},
                   {"listed", entry.listed}};
    if (!entry.is_folder())
        object.update({{"size", entry.content.size}, {"sha256", entry.content.sha256}});
    return object;
}

json json_of(const placement &placed)
{
    json object = {{"kind", word_for(placed.kind)},
                   {"parent", placed.parent},
                   {"name", placed.name},
                   {"inode", placed.stamp.inode},
                   {"set_aside", placed.set_aside}};
    if (!placed.is_folder())
        object.update({{"size", placed.content.size},
                       {"sha256", placed.content.sha256},
                       {"modified", placed.stamp.modified}});
    return object;
}

expected_content content_in(const json &object, entry_kind kind)
{
    if (kind == entry_kind::folder)
        return {};
    return {object.at("size"), object.at("sha256")};
}

known_entry entry_in(const json &object)
{
    known_entry entry;
    entry.kind = kind_called(object.at("kind"));
    entry.parent = object.at("parent");
    entry.name = object.at("name");
    entry.described = object.at("described");
    entry.listed = object.at("listed");
    entry.content = content_in(object, entry.kind);
    return entry;
}

placement placement_in(const json &object)
{
    placement placed;
    placed.kind = kind_called(object.at("kind"));
    placed.parent = object.at("parent");
    placed.name = object.at("name");
    check_local_name(placed.name);
    placed.set_aside = object.at("set_aside");
    placed.stamp.inode = object.at("inode");
    placed.content = content_in(object, placed.kind);
    if (!placed.is_folder()) {
        placed.stamp.size = placed.content.size;
        placed.stamp.modified = object.at("modified");
    }
    return placed;
}

// It becomes part of a name.
const std::string &checked(const std::string &key)
{
    if (!is_key(key))
        throw failure(exit_code::local_file, "the state of the mirror holds an unusable key",
                      advice);
    return key;
}

mirror_state state_of(const json &document)
{
    if (document.at("format") != format)
        throw failure(exit_code::local_file, "the mirror was made by another version", advice);
    mirror_state state;
    state.account.root = document.at("folder");
    state.account.revision = document.at("revision");
    state.account.epoch = document.at("epoch");
    for (const auto &[key, object] : document.at("entries").items())
        state.account.entries[key] = entry_in(object);
    for (const auto &[key, object] : document.at("placed").items())
        state.here[checked(key)] = placement_in(object);
    return state;
}

} // namespace

std::string text_of(const mirror_state &state)
{
    json entries = json::object();
    for (const auto &[key, entry] : state.account.entries)
        entries[key] = json_of(entry);
    json placed = json::object();
    for (const auto &[key, each] : state.here)
        placed[key] = json_of(each);
    const json document = {{"format", format},
                           {"folder", state.account.root},
                           {"revision", state.account.revision},
                           {"epoch", state.account.epoch},
                           {"entries", std::move(entries)},
                           {"placed", std::move(placed)}};
    return document.dump() + "\n";
}

mirror_state state_in(std::string_view text)
{
    try {
        return state_of(json::parse(text));
    } catch (const json::exception &) {
        throw failure(exit_code::local_file, "the state of the mirror cannot be read", advice);
    }
}

std::optional<mirror_state> load_state(int folder)
{
    const int flags = O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY;
    const descriptor file(::openat(folder, file_name, flags));
    if (!file && errno == ENOENT)
        return std::nullopt;
    std::string text;
    if (!file || !read_all(file.number(), largest_state, text))
        throw file_failure("cannot read the state of the mirror", errno);
    return state_in(text);
}

void save_state(int folder, const mirror_state &state)
{
    const std::string text = text_of(state);
    const int flags = O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK;
    const descriptor file(::openat(folder, new_file_name, flags, 0600));
    if (!file || !write_all(file.number(), text) || ::fsync(file.number()) != 0 ||
        ::renameat(folder, new_file_name, folder, file_name) != 0)
        throw file_failure("cannot write the state of the mirror", errno);
    ::fsync(folder); // a file system that cannot do it has done what it can
}

} // namespace quillmere::tools
