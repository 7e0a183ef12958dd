#include "profile.h"

#include <algorithm>
#include <iterator>
#include <sstream>

#include <unistd.h>

#include "failure.h"
#include "private_file.h"
#include "text.h"

namespace quillmere::tools {

namespace {

constexpr std::string_view profile_keys[] = {"app_id",       "app_key", "app_key_file", "ca_file",
                                             "email",        "proxy",   "retries",      "service",
                                             "session_file", "timeout"};

/** What people may try to write into the file, and where it belongs. */
struct secret_key {
    std::string_view key;
    const char *name;
    const char *advice;
};
constexpr const char *password_advice = "use --password-file or --password-stdin";
constexpr const char *session_advice =
    "the session is kept in a file of its own by: quillmere login";
constexpr secret_key secret_keys[] = {
    {"password", "a password", password_advice},
    {"passwd", "a password", password_advice},
    {"token", "a token", session_advice},
    {"session_token", "a session token", session_advice},
    {"login_token", "a login token", session_advice},
    {"facebook_token", "a Facebook token", "use --facebook-token-file"},
    {"fb_access_token", "a Facebook token", "use --facebook-token-file"},
};

constexpr const char *form_advice = "a line is [profile], key = value or # and a comment";

std::string place_of(const std::string &path, int number)
{
    return "the configuration file " + path + ":" + std::to_string(number);
}

[[noreturn]] void reject(const std::string &place, const std::string &why,
                         const std::string &advice)
{
    throw failure(exit_code::local_file, place + ": " + why, advice);
}

template <class Names> std::string listed(const Names &names)
{
    std::string text;
    for (const auto &each : names)
        text += (text.empty() ? "" : ", ") + std::string(each);
    return text;
}

// Only whole lines are comments: a "#" may well be part of a key.
bool says_nothing(std::string_view line)
{
    return line.empty() || line.front() == '#' || line.front() == ';';
}

struct entry {
    std::string key;
    std::string value;
};

void check_key(const std::string &key, const std::string &place)
{
    // The file is read by whoever may read it, and is copied from machine to machine.
    for (const secret_key &each : secret_keys)
        if (lower_case(key) == each.key)
            reject(place, std::string(each.name) + " must not stand here", each.advice);
    if (std::find(std::begin(profile_keys), std::end(profile_keys), key) == std::end(profile_keys))
        reject(place, "unknown key " + key, "the keys are " + listed(profile_keys));
}

entry read_entry(std::string_view line, const std::string &place)
{
    const std::size_t equals = line.find('=');
    if (equals == std::string_view::npos)
        reject(place, "expected [profile] or key = value", form_advice);
    const std::string key(trimmed(line.substr(0, equals)));
    check_key(key, place);
    return {key, std::string(trimmed(line.substr(equals + 1)))};
}

/** The name in a line that begins a section: "[work]" or "[profile work]"; nothing for another. */
std::optional<std::string> section_in(std::string_view line)
{
    constexpr std::string_view word = "profile";
    if (line.front() != '[' || line.back() != ']')
        return std::nullopt;
    std::string_view name = trimmed(line.substr(1, line.size() - 2));
    const std::string_view behind = name.substr(std::min(name.size(), word.size()));
    if (starts_with(name, word) && !behind.empty() && (behind[0] == ' ' || behind[0] == '\t'))
        name = trimmed(behind);
    return std::string(name);
}

std::string listed_profiles(const std::string &text)
{
    const std::vector<std::string> names = profile_names(text);
    return names.empty() ? "none" : listed(names);
}

} // namespace

std::optional<std::string> profile::value(const std::string &key) const
{
    const auto found = values_.find(key);
    if (found == values_.end() || found->second.value.empty())
        return std::nullopt;
    return found->second.value;
}

std::string profile::place(const std::string &key) const
{
    const auto found = values_.find(key);
    return found == values_.end() ? "the configuration file" : found->second.place;
}

std::string configuration_path(const environment &surroundings)
{
    return surroundings.directory("XDG_CONFIG_HOME", ".config") + "/quillmere/config";
}

profile read_profile(const std::string &text, const std::optional<std::string> &name,
                     const std::string &path)
{
    const std::string wanted = name.value_or("default");
    std::string section = "default";
    bool found = !name || wanted == section;
    profile chosen;
    std::istringstream lines(text);
    std::string whole_line;
    for (int number = 1; std::getline(lines, whole_line); ++number) {
        const std::string_view line = trimmed(whole_line);
        if (says_nothing(line))
            continue;
        if (const auto begun = section_in(line)) {
            section = *begun;
            found = found || section == wanted;
            continue;
        }
        const std::string place = place_of(path, number);
        const entry next = read_entry(line, place);
        if (section == wanted)
            chosen.set(next.key, next.value, place);
    }
    if (!found)
        throw failure(exit_code::local_file,
                      "the configuration file " + path + " has no profile [" + wanted + "]",
                      "it has " + listed_profiles(text));
    return chosen;
}

std::vector<std::string> profile_names(const std::string &text)
{
    std::vector<std::string> names;
    std::istringstream lines(text);
    std::string whole_line;
    while (std::getline(lines, whole_line)) {
        const std::string_view line = trimmed(whole_line);
        const auto begun = says_nothing(line) ? std::nullopt : section_in(line);
        if (begun && std::find(names.begin(), names.end(), *begun) == names.end())
            names.push_back(*begun);
    }
    return names;
}

profile load_profile(const std::string &path, const std::optional<std::string> &name)
{
    if (!name && ::access(path.c_str(), F_OK) != 0)
        return {};
    return read_profile(read_small_file(path, "the configuration file"), name, path);
}

} // namespace quillmere::tools
