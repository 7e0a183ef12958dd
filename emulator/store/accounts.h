// The accounts and what proves that somebody owns one.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace emulator {

class database;

struct new_account {
    std::string_view email;
    std::string_view password;
    /** Links the account to a Facebook account that proves itself with this token; may be empty. */
    std::string_view facebook_token;
};

/** Makes the account with an empty tree. Returns its id, or nothing if the e-mail address or the
 * Facebook token is taken. */
std::optional<std::int64_t> add_account(database &store, const new_account &made, std::int64_t now);

/** The id of the account whose address and password these are. Letter case of the address is
 * ignored. */
std::optional<std::int64_t> authenticate(database &store, std::string_view email,
                                         std::string_view password);

/** The id of the account that is linked to the Facebook account of this token. */
std::optional<std::int64_t> authenticate_facebook(database &store, std::string_view token);

/** The account's "pkey", a random text that stays the same for the life of the account. */
std::string account_pkey(database &store, std::int64_t account);

/** The revision of the account's file tree. */
std::uint64_t account_revision(database &store, std::int64_t account);

/** Which life of the tree this is: it grows when the tree is emptied and revisions begin anew. */
std::uint64_t account_epoch(database &store, std::int64_t account);

std::string account_email(database &store, std::int64_t account);
std::int64_t account_created(database &store, std::int64_t account);

/** The id of the account with this address, whose letter case is ignored. */
std::optional<std::int64_t> find_account(database &store, std::string_view email);

/** Bytes; what is not set stays. */
struct account_limits {
    std::optional<std::int64_t> base_storage;
    std::optional<std::int64_t> bonus_storage;
    std::optional<std::int64_t> bandwidth;
};

void put_account_limits(database &store, std::int64_t account, const account_limits &limits);

} // namespace emulator
