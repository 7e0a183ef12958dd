// Session tokens and one-time login tokens. The store holds digests of them alone.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace emulator {

class database;

/** When it is, and how long an unused session lives; both in seconds. */
struct session_time {
    std::int64_t now;
    std::int64_t lifetime;
};

/** Makes a session and returns its token. Sessions that have expired are forgotten on the way. */
std::string open_session(database &store, std::int64_t account, session_time time);

/**
 * The account of a live session, whose life begins anew. That is recorded only once a tenth of
 * the lifetime has passed since the last record: a read need not wait for the disk each time.
 */
std::optional<std::int64_t> use_session(database &store, std::string_view token, session_time time);

/** Trades a live session for a new one; the old token is worth nothing from then on. */
std::optional<std::string> renew_session(database &store, std::string_view token,
                                         session_time time);

/** Makes a one-time login token, good for this many seconds. */
std::string make_login_token(database &store, std::int64_t account, session_time time);

} // namespace emulator
