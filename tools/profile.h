// The configuration file: sections of "key = value" lines, one section for each profile.
#pragma once

#include <map>
#include <optional>
#include <string>

#include "environment.h"

namespace quillmere::tools {

/** The settings of one profile. */
class profile {
public:
    std::optional<std::string> value(const std::string &key) const;
    void set(const std::string &key, const std::string &value) { values_[key] = value; }

private:
    std::map<std::string, std::string> values_;
};

/** $XDG_CONFIG_HOME/quillmere/config, or the same below ~/.config. */
std::string configuration_path(const environment &surroundings);

/**
 * A profile in the text of a configuration file.
 *
 * @param name  the section; nothing takes "default", which may be absent
 * @param path  names the file in a failure: an unknown profile or key, or a line of another form
 */
profile read_profile(const std::string &text, const std::optional<std::string> &name,
                     const std::string &path);

/** The profile in the configuration file; an empty one if there is no such file and no name. */
profile load_profile(const std::string &path, const std::optional<std::string> &name);

} // namespace quillmere::tools
