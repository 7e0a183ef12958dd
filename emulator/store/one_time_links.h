// Links that serve a file's bytes once.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace emulator {

class database;

inline constexpr std::int64_t one_time_link_lifetime = 24 * 60 * 60;

/** Makes a link and returns its key. Links that have expired are forgotten on the way. */
std::string make_one_time_link(database &store, std::int64_t file, std::int64_t now);

/** The file of a link that was not used yet. */
std::optional<std::int64_t> find_one_time_link(database &store, std::string_view link_key,
                                               std::int64_t now);

/** It is worth nothing from then on. */
void spend_one_time_link(database &store, std::string_view link_key);

} // namespace emulator
