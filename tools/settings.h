// What the program runs with: the command line before the environment before the configuration file
// before the session, and defaults last.
#pragma once

#include <optional>
#include <string>

#include "arguments.h"
#include "ca_bundle.h"
#include "emulator_address.h"
#include "environment.h"
#include "profile.h"
#include "service_address.h"
#include "session_file.h"

namespace quillmere::tools {

/** A proxy and who named it. */
struct proxy_choice {
    std::string url;
    std::string source;
};

struct settings {
    service_addresses addresses;
    std::optional<emulator_address> emulator; ///< when the service is one
    std::optional<ca_bundle> ca;              ///< nothing only when verification is off
    std::optional<proxy_choice> proxy;        ///< when it is not the environment's
    int timeout_seconds = 30;
    int retries = 4;
};

/** Where settings come from besides the command line. */
struct setting_sources {
    const environment &surroundings;
    const profile &chosen_profile;
    std::optional<session> signed_in; ///< its service is asked when no other is named
    std::string default_service;
    std::vector<std::string> system_bundles = system_bundle_paths();
};

/** Where the session is kept: what the command line names before the environment before the
 * configuration file, or else session_path(). */
session_file choose_session_file(const common_arguments &given, const environment &surroundings,
                                 const profile &chosen_profile);

/** Decides; a failure when sources contradict each other or name something unusable. */
settings decide_settings(const common_arguments &given, const setting_sources &sources);

} // namespace quillmere::tools
