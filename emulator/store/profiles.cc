#include "store/profiles.h"

#include <algorithm>
#include <iterator>

#include "store/accounts.h"
#include "store/database.h"

namespace emulator {
namespace {

constexpr std::string_view facebook = "facebook/";
constexpr std::string_view twitter = "twitter/";

template <std::size_t Count> bool lists(const profile_field (&fields)[Count], std::string_view name)
{
    return std::any_of(std::begin(fields), std::end(fields),
                       [name](const profile_field &each) { return name == each.name; });
}

bool begins_with(std::string_view text, std::string_view beginning)
{
    return text.substr(0, beginning.size()) == beginning;
}

bool tells_of(const profile &of, std::string_view social)
{
    return std::any_of(of.begin(), of.end(), [social](const profile::value_type &each) {
        return begins_with(each.first, social);
    });
}

} // namespace

bool is_profile_field(std::string_view name)
{
    if (begins_with(name, facebook))
        return lists(facebook_fields, name.substr(facebook.size()));
    if (begins_with(name, twitter))
        return lists(twitter_fields, name.substr(twitter.size()));
    return name == "display_name" || lists(own_fields, name);
}

void put_profile_field(database &store, std::int64_t account, std::string_view name,
                       std::string_view value)
{
    store
        .prepare("INSERT INTO profile_fields (account, name, value) VALUES (?, ?, ?)"
                 " ON CONFLICT (account, name) DO UPDATE SET value = excluded.value")
        .bind(account, name, value)
        .run();
}

profile profile_of(database &store, std::int64_t account)
{
    profile all;
    statement query = store.prepare("SELECT name, value FROM profile_fields WHERE account = ?");
    query.bind(account);
    while (query.step())
        all.emplace(query.text(0), query.text(1));
    return all;
}

std::string owner_name(database &store, std::int64_t account)
{
    statement query = store.prepare(
        "SELECT value FROM profile_fields WHERE account = ? AND name = 'display_name'");
    if (query.bind(account).step())
        return query.text(0);
    const std::string email = account_email(store, account);
    return email.substr(0, email.find('@'));
}

bool is_facebook_linked(database &store, std::int64_t account, const profile &of)
{
    return tells_of(of, facebook) ||
           store.prepare("SELECT 1 FROM facebook_links WHERE account = ?").bind(account).step();
}

bool is_twitter_linked(const profile &of) { return tells_of(of, twitter); }

} // namespace emulator
