#include "store/sessions.h"

#include "digest.h"
#include "store/database.h"

namespace emulator {
namespace {

constexpr std::size_t token_bytes = 32;

struct live_session {
    std::int64_t account;
    std::int64_t expires;
};

std::optional<live_session> find_session(database &store, std::string_view digest, std::int64_t now)
{
    statement query = store.prepare(
        "SELECT account, expires FROM sessions WHERE token_digest = ? AND expires > ?");
    if (!query.bind(blob{digest}, now).step())
        return std::nullopt;
    return live_session{query.number(0), query.number(1)};
}

std::string insert_token(database &store, const std::string &table, std::int64_t account,
                         session_time time)
{
    std::string token = random_hex(token_bytes);
    const std::string digest = sha256(token);
    store.prepare("DELETE FROM " + table + " WHERE expires <= ?").bind(time.now).run();
    store.prepare("INSERT INTO " + table + " (token_digest, account, expires) VALUES (?, ?, ?)")
        .bind(blob{digest}, account, time.now + time.lifetime)
        .run();
    return token;
}

std::string insert_token_alone(database &store, const std::string &table, std::int64_t account,
                               session_time time)
{
    transaction change(store);
    std::string token = insert_token(store, table, account, time);
    change.commit();
    return token;
}

} // namespace

std::string open_session(database &store, std::int64_t account, session_time time)
{
    return insert_token_alone(store, "sessions", account, time);
}

std::optional<std::int64_t> use_session(database &store, std::string_view token, session_time time)
{
    const std::string digest = sha256(token);
    const std::optional<live_session> session = find_session(store, digest, time.now);
    if (!session)
        return std::nullopt;
    const std::int64_t expires = time.now + time.lifetime;
    if (expires > session->expires && expires - session->expires >= time.lifetime / 10)
        store.prepare("UPDATE sessions SET expires = ? WHERE token_digest = ?")
            .bind(expires, blob{digest})
            .run();
    return session->account;
}

std::optional<std::string> renew_session(database &store, std::string_view token, session_time time)
{
    const std::string digest = sha256(token);
    transaction change(store);
    const std::optional<live_session> session = find_session(store, digest, time.now);
    if (!session)
        return std::nullopt;
    store.prepare("DELETE FROM sessions WHERE token_digest = ?").bind(blob{digest}).run();
    std::string renewed = insert_token(store, "sessions", session->account, time);
    change.commit();
    return renewed;
}

std::string make_login_token(database &store, std::int64_t account, session_time time)
{
    return insert_token_alone(store, "login_tokens", account, time);
}

} // namespace emulator
