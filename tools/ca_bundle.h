// Which certificate authorities the service's certificate is checked against.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace quillmere::tools {

/** A bundle and who named it, which a person needs to know when it turns out to be the wrong one.
 */
struct ca_bundle {
    std::string path;
    std::string source;
};

/** What may name a bundle, the first of those that do counting. */
struct ca_candidates {
    std::optional<std::string> flag;
    std::optional<std::string> profile;
    std::optional<std::string> environment;
    std::optional<std::string> emulator;
    std::vector<std::string> system; ///< the first of these that exists
};

/** Where systems keep their bundle. */
std::vector<std::string> system_bundle_paths();

/**
 * Chooses the bundle. One that was named must be there and hold a certificate: falling back to
 * another would trust authorities that nobody chose.
 */
ca_bundle choose_ca_bundle(const ca_candidates &candidates);

} // namespace quillmere::tools
