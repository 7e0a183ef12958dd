#include "store/accounts.h"

#include "digest.h"
#include "store/database.h"
#include "store/folders.h"

namespace emulator {
namespace {

constexpr std::size_t pkey_bytes = 5;

bool is_unique_conflict(const store_error &problem)
{
    return problem.code() == SQLITE_CONSTRAINT_UNIQUE;
}

std::int64_t insert_account(database &store, const new_account &made, std::int64_t now)
{
    const stretched_password password = stretch_password(made.password);
    const std::string pkey = random_hex(pkey_bytes);
    store
        .prepare("INSERT INTO accounts (email, password_salt, password_iterations,"
                 " password_digest, pkey, created) VALUES (?, ?, ?, ?, ?, ?)")
        .bind(made.email, blob{password.salt}, password.iterations, blob{password.digest},
              std::string_view(pkey), now)
        .run();
    return store.last_row();
}

void link_facebook(database &store, std::int64_t account, std::string_view token)
{
    const std::string digest = sha256(token);
    store.prepare("INSERT INTO facebook_links (account, token_digest) VALUES (?, ?)")
        .bind(account, blob{digest})
        .run();
}

statement account_row(database &store, std::string_view column, std::int64_t account)
{
    statement query =
        store.prepare("SELECT " + std::string(column) + " FROM accounts WHERE id = ?");
    if (!query.bind(account).step())
        throw std::logic_error("an account that does not exist");
    return query;
}

} // namespace

std::optional<std::int64_t> add_account(database &store, const new_account &made, std::int64_t now)
{
    try {
        transaction change(store);
        const std::int64_t account = insert_account(store, made, now);
        if (!made.facebook_token.empty())
            link_facebook(store, account, made.facebook_token);
        make_root(store, account, now);
        change.commit();
        return account;
    } catch (const store_error &problem) {
        if (is_unique_conflict(problem))
            return std::nullopt;
        throw;
    }
}

std::optional<std::int64_t> authenticate(database &store, std::string_view email,
                                         std::string_view password)
{
    statement query = store.prepare("SELECT id, password_salt, password_iterations,"
                                    " password_digest FROM accounts WHERE email = ?");
    if (!query.bind(email).step()) {
        // The same work as for a known address, so that the time does not tell which are known.
        stretch_password(password);
        return std::nullopt;
    }
    const stretched_password stored{query.text(1), query.number(2), query.text(3)};
    if (!password_matches(password, stored))
        return std::nullopt;
    return query.number(0);
}

std::optional<std::int64_t> authenticate_facebook(database &store, std::string_view token)
{
    const std::string digest = sha256(token);
    statement query = store.prepare("SELECT account FROM facebook_links WHERE token_digest = ?");
    if (!query.bind(blob{digest}).step())
        return std::nullopt;
    return query.number(0);
}

std::string account_pkey(database &store, std::int64_t account)
{
    return account_row(store, "pkey", account).text(0);
}

std::uint64_t account_revision(database &store, std::int64_t account)
{
    return static_cast<std::uint64_t>(account_row(store, "revision", account).number(0));
}

std::uint64_t account_epoch(database &store, std::int64_t account)
{
    return static_cast<std::uint64_t>(account_row(store, "epoch", account).number(0));
}

std::string account_email(database &store, std::int64_t account)
{
    return account_row(store, "email", account).text(0);
}

std::int64_t account_created(database &store, std::int64_t account)
{
    return account_row(store, "created", account).number(0);
}

std::optional<std::int64_t> find_account(database &store, std::string_view email)
{
    statement query = store.prepare("SELECT id FROM accounts WHERE email = ?");
    if (!query.bind(email).step())
        return std::nullopt;
    return query.number(0);
}

void put_account_limits(database &store, std::int64_t account, const account_limits &limits)
{
    constexpr std::int64_t unchanged = -1;
    store
        .prepare("UPDATE accounts SET"
                 " base_storage = CASE ?2 WHEN -1 THEN base_storage ELSE ?2 END,"
                 " bonus_storage = CASE ?3 WHEN -1 THEN bonus_storage ELSE ?3 END,"
                 " bandwidth_limit = CASE ?4 WHEN -1 THEN bandwidth_limit ELSE ?4 END"
                 " WHERE id = ?1")
        .bind(account, limits.base_storage.value_or(unchanged),
              limits.bonus_storage.value_or(unchanged), limits.bandwidth.value_or(unchanged))
        .run();
}

} // namespace emulator
