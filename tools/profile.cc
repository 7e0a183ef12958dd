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

constexpr std::string_view known_keys[] = {"app_id", "app_key", "app_key_file", "ca_file",
                                           "email",  "retries", "service",      "timeout"};

[[noreturn]] void reject(const std::string &path, int number, const std::string &why)
{
    throw failure(exit_code::local_file, "the configuration file " + path + ", line " +
                                             std::to_string(number) + ": " + why);
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

entry read_entry(std::string_view line, const std::string &path, int number)
{
    const std::size_t equals = line.find('=');
    if (equals == std::string_view::npos)
        reject(path, number, "expected [profile] or key = value");
    const std::string key(trimmed(line.substr(0, equals)));
    if (std::find(std::begin(known_keys), std::end(known_keys), key) == std::end(known_keys))
        reject(path, number, "unknown key " + key);
    return {key, std::string(trimmed(line.substr(equals + 1)))};
}

} // namespace

std::optional<std::string> profile::value(const std::string &key) const
{
    const auto found = values_.find(key);
    if (found == values_.end() || found->second.empty())
        return std::nullopt;
    return found->second;
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
        if (line.front() == '[' && line.back() == ']') {
            section = std::string(trimmed(line.substr(1, line.size() - 2)));
            found = found || section == wanted;
            continue;
        }
        const entry next = read_entry(line, path, number);
        if (section == wanted)
            chosen.set(next.key, next.value);
    }
    if (!found)
        throw failure(exit_code::local_file,
                      "the configuration file " + path + " has no profile [" + wanted + "]");
    return chosen;
}

profile load_profile(const std::string &path, const std::optional<std::string> &name)
{
    if (!name && ::access(path.c_str(), F_OK) != 0)
        return {};
    return read_profile(read_small_file(path, "the configuration file"), name, path);
}

} // namespace quillmere::tools
