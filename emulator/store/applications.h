// The applications that may ask for tokens.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace emulator {

class database;

struct application {
    std::string_view id;
    std::string_view key;
};

/** Registered in every new store, so that a developer can log in at once. No secret. */
inline constexpr application development_application{"42", "quillmere-development-key"};

/** Registers an application, or gives a registered one another key. */
void put_application(database &store, const application &made);

/** The key of an application, or nothing if it is not registered. */
std::optional<std::string> find_application_key(database &store, std::string_view id);

} // namespace emulator
