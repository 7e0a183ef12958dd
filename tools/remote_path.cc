#include "remote_path.h"

#include <algorithm>

#include "failure.h"
#include "text.h"

namespace quillmere::tools {

namespace {

constexpr std::string_view key_prefix = "key:";

struct parsed_path {
    std::string key; // where it begins; empty for the root
    std::vector<std::string> names;
    bool folder_meant = false;
};

std::string checked_key(std::string_view key, const std::string &path)
{
    if (!is_key(key))
        throw failure(exit_code::usage, path + " holds no usable key",
                      "a key is made of letters and digits");
    return std::string(key);
}

void add_name(parsed_path &parsed, std::string_view name, const std::string &path)
{
    if (name.empty())
        return; // slashes in a row count as one
    if (name == "." || name == "..")
        throw failure(exit_code::usage, path + " cannot be followed",
                      "there is no . and no .. in a path of the service");
    parsed.names.emplace_back(name);
}

parsed_path parse_path(const std::string &path)
{
    if (path.empty())
        throw failure(exit_code::usage, "a path is empty", "the account's root is /");
    parsed_path parsed;
    std::string_view rest = path;
    if (starts_with(rest, key_prefix)) {
        const std::size_t end = std::min(rest.find('/'), rest.size());
        parsed.key = checked_key(rest.substr(key_prefix.size(), end - key_prefix.size()), path);
        rest.remove_prefix(end);
    }
    parsed.folder_meant = ends_with(rest, "/");
    while (!rest.empty()) {
        const std::size_t end = std::min(rest.find('/'), rest.size());
        add_name(parsed, rest.substr(0, end), path);
        rest.remove_prefix(std::min(end + 1, rest.size()));
    }
    return parsed;
}

void add_matches(const remote_tree &tree, const remote_entry &folder, entry_kind kind,
                 const std::string &name, std::vector<remote_entry> &matches)
{
    for (remote_entry &each : tree.list(folder, kind))
        if (each.name == name)
            matches.push_back(std::move(each));
}

[[noreturn]] void throw_ambiguous(const std::vector<remote_entry> &matches)
{
    std::string keys;
    for (const remote_entry &each : matches)
        keys += (keys.empty() ? "key:" : " or key:") + each.key;
    throw failure(exit_code::usage,
                  "several entries of the folder are called " + matches.front().name,
                  "name one of them as " + keys);
}

// A folder attached from another account may have a name that its new place has already. Which of
// the two is meant must not be guessed, so that all of the listing is read.
std::optional<remote_entry> find_child(const remote_tree &tree, const remote_entry &folder,
                                       const std::string &name, bool must_be_folder)
{
    std::vector<remote_entry> matches;
    add_matches(tree, folder, entry_kind::folder, name, matches);
    if (!must_be_folder || matches.empty())
        add_matches(tree, folder, entry_kind::file, name, matches);
    if (matches.size() > 1)
        throw_ambiguous(matches);
    if (matches.empty())
        return std::nullopt;
    return matches.front();
}

void require_folder(const remote_entry &entry)
{
    if (!entry.is_folder())
        throw failure(exit_code::refused, entry.name + " is a file, not a folder",
                      "look at what is there with: quillmere ls");
}

} // namespace

bool is_key(std::string_view text)
{
    constexpr std::string_view marks = "-._~";
    for (const char each : text) {
        const bool letter = (each >= 'a' && each <= 'z') || (each >= 'A' && each <= 'Z');
        const bool digit = each >= '0' && each <= '9';
        if (!letter && !digit && marks.find(each) == std::string_view::npos)
            return false;
    }
    return !text.empty();
}

const char *word_for(entry_kind kind) { return kind == entry_kind::folder ? "folder" : "file"; }

remote_place follow_path(const remote_tree &tree, const std::string &path)
{
    const parsed_path parsed = parse_path(path);
    remote_place place;
    place.folder_meant = parsed.folder_meant;
    if (!parsed.key.empty())
        place.reached = tree.describe(parsed.key);

    auto name = parsed.names.begin();
    for (; name != parsed.names.end(); ++name) {
        require_folder(place.reached);
        const bool last = name + 1 == parsed.names.end();
        auto child = find_child(tree, place.reached, *name, !last || parsed.folder_meant);
        if (!child)
            break;
        place.reached = std::move(*child);
    }
    place.missing.assign(name, parsed.names.end());
    if (place.exists() && place.folder_meant)
        require_folder(place.reached);
    return place;
}

remote_entry find_entry(const remote_tree &tree, const std::string &path)
{
    remote_place place = follow_path(tree, path);
    if (!place.exists())
        throw_missing(path);
    return std::move(place.reached);
}

remote_entry find_folder(const remote_tree &tree, const std::string &path)
{
    remote_entry found = find_entry(tree, path);
    require_folder(found);
    return found;
}

remote_entry find_file(const remote_tree &tree, const std::string &path)
{
    remote_entry found = find_entry(tree, path);
    if (found.is_folder())
        throw failure(exit_code::refused, path + " is a folder, not a file",
                      "name a file in it; quillmere ls lists them");
    return found;
}

void throw_missing(const std::string &path)
{
    throw failure(exit_code::refused, "there is no " + path,
                  "look at what is there with: quillmere ls");
}

std::optional<std::string> key_in(const std::string &path)
{
    if (!starts_with(path, key_prefix) || path.find('/') != std::string::npos)
        return std::nullopt;
    return checked_key(std::string_view(path).substr(key_prefix.size()), path);
}

std::string path_below(const std::string &folder_path, const std::string &name)
{
    return folder_path + (ends_with(folder_path, "/") ? "" : "/") + name;
}

} // namespace quillmere::tools
