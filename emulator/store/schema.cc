#include "store/schema.h"

#include <iterator>

#include "store/applications.h"
#include "store/database.h"

namespace emulator {
namespace {

// Never change a step that has been published: add one. Times are seconds since 1970.
const char *const steps[] = {
    R"sql(
    CREATE TABLE applications (
        id  TEXT PRIMARY KEY,
        key TEXT NOT NULL -- in clear: every signature is computed from it
    ) STRICT;

    CREATE TABLE accounts (
        id                  INTEGER PRIMARY KEY,
        email               TEXT NOT NULL UNIQUE COLLATE NOCASE,
        password_salt       BLOB NOT NULL,
        password_iterations INTEGER NOT NULL,
        password_digest     BLOB NOT NULL,
        pkey                TEXT NOT NULL,
        revision            INTEGER NOT NULL DEFAULT 1, -- of the account's file tree
        created             INTEGER NOT NULL
    ) STRICT;

    CREATE TABLE facebook_links (
        account      INTEGER PRIMARY KEY REFERENCES accounts ON DELETE CASCADE,
        token_digest BLOB NOT NULL UNIQUE
    ) STRICT;

    CREATE TABLE sessions (
        token_digest BLOB PRIMARY KEY,
        account      INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        expires      INTEGER NOT NULL
    ) STRICT;
    CREATE INDEX sessions_by_account ON sessions (account);
    CREATE INDEX sessions_by_expiry ON sessions (expires);

    CREATE TABLE login_tokens (
        token_digest BLOB PRIMARY KEY,
        account      INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        expires      INTEGER NOT NULL
    ) STRICT;
    CREATE INDEX login_tokens_by_account ON login_tokens (account);
    CREATE INDEX login_tokens_by_expiry ON login_tokens (expires);
    )sql",
};

constexpr std::int64_t newest = std::size(steps);

std::int64_t version_of(database &store)
{
    statement query = store.prepare("PRAGMA user_version");
    query.step();
    return query.number(0);
}

} // namespace

void bring_up_to_date(database &store)
{
    if (version_of(store) == newest)
        return;
    transaction change(store);
    // Asked again under the lock: another process may have made the same steps meanwhile.
    const std::int64_t version = version_of(store);
    if (version > newest)
        throw store_error(SQLITE_SCHEMA, "store: written by a later version of this program");
    for (std::int64_t next = version; next < newest; ++next)
        store.execute(steps[next]);
    if (version == 0)
        put_application(store, development_application);
    store.execute("PRAGMA user_version = " + std::to_string(newest));
    change.commit();
}

} // namespace emulator
