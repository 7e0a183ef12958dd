// What an account tells of its owner, and of the social accounts that are linked to it.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>

namespace emulator {

class database;

/** Values by the names of the table below. */
using profile = std::map<std::string, std::string, std::less<>>;

struct profile_field {
    const char *name;
    const char *unset; // what is told when the account has no value of its own
};

/** Those of the account itself, and those of the linked accounts. */
inline constexpr profile_field own_fields[] = {
    {"first_name", ""},      {"last_name", ""}, {"gender", ""},    {"birth_date", ""},
    {"location", ""},        {"website", ""},   {"premium", "no"}, {"validated", "yes"},
    {"tos_accepted", "yes"}, {"options", ""},
};
inline constexpr profile_field facebook_fields[] = {
    {"facebook_id", ""}, {"date_created", ""}, {"email", ""},    {"facebook_url", ""},
    {"name", ""},        {"firstname", ""},    {"lastname", ""}, {"hometown", ""},
    {"location", ""},    {"i18n", ""},         {"timezone", ""},
};
inline constexpr profile_field twitter_fields[] = {
    {"twitter_id", ""}, {"date_created", ""}, {"screen_name", ""}, {"name", ""}, {"i18n", ""},
};

/** Whether a field has this name: "display_name", one of the tables, or "facebook/name" and such.
 */
bool is_profile_field(std::string_view name);

void put_profile_field(database &store, std::int64_t account, std::string_view name,
                       std::string_view value);
profile profile_of(database &store, std::int64_t account);

/** What others are told of who it is: the display name, or else the part of the address before
 * the "@". */
std::string owner_name(database &store, std::int64_t account);

/** Linked by a token that signs in with it, or told of in the profile. */
bool is_facebook_linked(database &store, std::int64_t account, const profile &of);
bool is_twitter_linked(const profile &of);

} // namespace emulator
