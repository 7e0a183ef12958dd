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
    R"sql(
    ALTER TABLE accounts ADD COLUMN epoch INTEGER NOT NULL DEFAULT 1; -- which life of the tree
    ALTER TABLE accounts ADD COLUMN base_storage INTEGER NOT NULL DEFAULT 10737418240;
    ALTER TABLE accounts ADD COLUMN bonus_storage INTEGER NOT NULL DEFAULT 0;
    ALTER TABLE accounts ADD COLUMN bandwidth_limit INTEGER NOT NULL DEFAULT 53687091200;
    ALTER TABLE accounts ADD COLUMN bandwidth_used INTEGER NOT NULL DEFAULT 0;
    ALTER TABLE accounts ADD COLUMN use_day INTEGER NOT NULL DEFAULT 0; -- of the two below
    ALTER TABLE accounts ADD COLUMN streamed_today INTEGER NOT NULL DEFAULT 0;
    ALTER TABLE accounts ADD COLUMN one_time_today INTEGER NOT NULL DEFAULT 0;

    CREATE TABLE profile_fields (
        account INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        name    TEXT NOT NULL, -- as in the reply, "facebook/hometown"
        value   TEXT NOT NULL,
        PRIMARY KEY (account, name)
    ) STRICT, WITHOUT ROWID;

    -- What was deleted stays, with its date, so that its key still tells what it was.
    CREATE TABLE folders (
        id          INTEGER PRIMARY KEY,
        key         TEXT NOT NULL UNIQUE,
        account     INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        parent      INTEGER REFERENCES folders, -- NULL for an account's root
        name        TEXT NOT NULL,
        description TEXT NOT NULL DEFAULT '',
        tags        TEXT NOT NULL DEFAULT '',
        privacy     TEXT NOT NULL CHECK (privacy IN ('public', 'private')),
        created     INTEGER NOT NULL,
        modified    INTEGER NOT NULL,
        deleted     INTEGER -- NULL while it lives
    ) STRICT;
    CREATE UNIQUE INDEX root_of_account ON folders (account) WHERE parent IS NULL;
    CREATE UNIQUE INDEX folders_by_name ON folders (parent, name) WHERE deleted IS NULL;
    CREATE INDEX folders_in_order ON folders (parent) WHERE deleted IS NULL;

    CREATE TABLE files (
        id          INTEGER PRIMARY KEY,
        key         TEXT NOT NULL UNIQUE,
        link_key    TEXT NOT NULL UNIQUE, -- who knows it may fetch the bytes
        account     INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        folder      INTEGER NOT NULL REFERENCES folders,
        name        TEXT NOT NULL,
        description TEXT NOT NULL DEFAULT '',
        tags        TEXT NOT NULL DEFAULT '',
        privacy     TEXT NOT NULL CHECK (privacy IN ('public', 'private')),
        created     INTEGER NOT NULL,
        modified    INTEGER NOT NULL,
        size        INTEGER NOT NULL DEFAULT 0,
        hash        TEXT NOT NULL DEFAULT '', -- SHA-256 in hexadecimal; empty: no content yet
        downloads   INTEGER NOT NULL DEFAULT 0,
        deleted     INTEGER
    ) STRICT;
    CREATE UNIQUE INDEX files_by_name ON files (folder, name) WHERE deleted IS NULL;
    CREATE INDEX files_in_order ON files (folder) WHERE deleted IS NULL;
    CREATE INDEX files_by_account ON files (account) WHERE deleted IS NULL;

    CREATE TABLE attachments (
        account INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        folder  INTEGER NOT NULL REFERENCES folders ON DELETE CASCADE,
        created INTEGER NOT NULL,
        PRIMARY KEY (account, folder)
    ) STRICT, WITHOUT ROWID;
    CREATE INDEX attachments_by_folder ON attachments (folder);

    -- The change feed: for each account one row for each entry that it sees or saw, with the
    -- revision of that account at which it last changed. Roots have none.
    CREATE TABLE feed (
        account    INTEGER NOT NULL REFERENCES accounts ON DELETE CASCADE,
        key        TEXT NOT NULL,
        is_folder  INTEGER NOT NULL,
        parent_key TEXT NOT NULL, -- as the account sees it
        revision   INTEGER NOT NULL,
        deleted    INTEGER NOT NULL,
        PRIMARY KEY (account, key)
    ) STRICT, WITHOUT ROWID;
    CREATE UNIQUE INDEX feed_by_revision ON feed (account, revision);

    CREATE TABLE one_time_links (
        link_key TEXT PRIMARY KEY,
        file     INTEGER NOT NULL REFERENCES files ON DELETE CASCADE,
        expires  INTEGER NOT NULL
    ) STRICT;
    CREATE INDEX one_time_links_by_file ON one_time_links (file);

    INSERT INTO folders (key, account, parent, name, privacy, created, modified)
        SELECT substr(lower(hex(randomblob(7))), 1, 13), id, NULL, 'My files', 'public', created,
            created FROM accounts;
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
