#include "store/attachments.h"

#include <algorithm>

#include "errors.h"
#include "store/database.h"
#include "store/feed.h"
#include "store/usage.h"

namespace emulator {
namespace {

bool contains(const std::vector<std::int64_t> &accounts, std::int64_t account)
{
    return std::find(accounts.begin(), accounts.end(), account) != accounts.end();
}

std::vector<std::int64_t> missing_from(const std::vector<std::int64_t> &others,
                                       const std::vector<std::int64_t> &accounts)
{
    std::vector<std::int64_t> missing;
    std::copy_if(accounts.begin(), accounts.end(), std::back_inserter(missing),
                 [&others](std::int64_t account) { return !contains(others, account); });
    return missing;
}

} // namespace

void view_change::keep(const std::vector<std::int64_t> &accounts)
{
    for (const std::int64_t account : missing_from(after_, accounts))
        after_.push_back(account);
}

std::vector<std::int64_t> view_change::lost() const { return missing_from(after_, before_); }

std::vector<std::int64_t> view_change::gained() const { return missing_from(before_, after_); }

std::vector<std::int64_t> view_change::kept() const { return missing_from(gained(), after_); }

bool is_attached(database &store, std::int64_t account, std::int64_t folder)
{
    return store.prepare("SELECT 1 FROM attachments WHERE account = ? AND folder = ?")
        .bind(account, folder)
        .step();
}

bool sees_folder(database &store, std::int64_t account, std::int64_t folder)
{
    return contains(viewers_of(store, folder), account);
}

bool is_shared(database &store, std::int64_t folder)
{
    return viewers_of(store, folder).size() > 1; // the owner is one
}

void attach_folder(database &store, std::int64_t account, const folder &foreign, std::int64_t now)
{
    if (is_attached(store, account, foreign.id))
        throw refusal(error::attachment_wrong);
    if (attached_today(store, account, now) >= collaboration_limit)
        throw refusal(error::daily_limit_reached);
    // Inside an attached folder it was seen before; it only moves into the root.
    const bool was_seen = sees_folder(store, account, foreign.id);
    store.prepare("INSERT INTO attachments (account, folder, created) VALUES (?, ?, ?)")
        .bind(account, foreign.id, now)
        .run();
    record_for(store, account, was_seen ? feed_scope::folder : feed_scope::tree, foreign.id,
               feed_kind::updated);
}

void detach_folder(database &store, std::int64_t account, const folder &foreign)
{
    if (!is_attached(store, account, foreign.id))
        throw refusal(error::attachment_wrong);
    record_for(store, account, feed_scope::tree, foreign.id, feed_kind::deleted);
    store.prepare("DELETE FROM attachments WHERE account = ? AND folder = ?")
        .bind(account, foreign.id)
        .run();
    if (sees_folder(store, account, foreign.id)) // inside another one that stays attached
        record_for(store, account, feed_scope::tree, foreign.id, feed_kind::updated);
}

std::uint64_t attached_today(database &store, std::int64_t account, std::int64_t now)
{
    statement query =
        store.prepare("SELECT count(*) FROM attachments WHERE account = ? AND created >= ?");
    query.bind(account, start_of_day(now)).step();
    return static_cast<std::uint64_t>(query.number(0));
}

} // namespace emulator
