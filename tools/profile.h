// The configuration file: sections of "key = value" lines, one section for each profile.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "environment.h"

namespace quillmere::tools {

/** The settings of one profile. */
class profile {
public:
    std::optional<std::string> value(const std::string &key) const;

    /** Where the value is from, for a failure: "the configuration file /home/a/config:3". */
    std::string place(const std::string &key) const;

    void set(const std::string &key, const std::string &value,
             const std::string &place = "the configuration file")
    {
        values_[key] = {value, place};
    }

private:
    struct placed_value {
        std::string value;
        std::string place;
    };
    std::map<std::string, placed_value> values_;
};

/** $XDG_CONFIG_HOME/quillmere/config, or the same below ~/.config. */
std::string configuration_path(const environment &surroundings);

/**
 * A profile in the text of a configuration file.
 *
 * @param name  the section, [name] or [profile name]; nothing takes "default", which may be absent
 * @param path  names the file in a failure: an unknown profile or key, a secret, or a line of
 *              another form
 */
profile read_profile(const std::string &text, const std::optional<std::string> &name,
                     const std::string &path);

/** The names of the sections, each once, in the order of the file. */
std::vector<std::string> profile_names(const std::string &text);

/** The profile in the configuration file; an empty one if there is no such file and no name. */
profile load_profile(const std::string &path, const std::optional<std::string> &name);

} // namespace quillmere::tools
