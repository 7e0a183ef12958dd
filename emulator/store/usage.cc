#include "store/usage.h"

#include <stdexcept>

#include "errors.h"
#include "store/database.h"

namespace emulator {
namespace {

constexpr std::int64_t seconds_of_day = 24 * 60 * 60;

std::uint64_t used_storage_of(database &store, std::int64_t account)
{
    statement query = store.prepare(
        "SELECT coalesce(sum(size), 0) FROM files WHERE account = ? AND deleted IS NULL");
    query.bind(account).step();
    return static_cast<std::uint64_t>(query.number(0));
}

} // namespace

std::int64_t start_of_day(std::int64_t now) { return now - now % seconds_of_day; }

account_usage usage_of(database &store, std::int64_t account, std::int64_t now)
{
    statement query = store.prepare(
        "SELECT base_storage, bonus_storage, bandwidth_limit, bandwidth_used,"
        " CASE use_day WHEN ?2 THEN streamed_today ELSE 0 END,"
        " CASE use_day WHEN ?2 THEN one_time_today ELSE 0 END FROM accounts WHERE id = ?1");
    if (!query.bind(account, start_of_day(now)).step())
        throw std::logic_error("an account that does not exist");
    const auto figure = [&query](int column) {
        return static_cast<std::uint64_t>(query.number(column));
    };
    return {figure(0), figure(1), used_storage_of(store, account), figure(2), figure(3),
            figure(4), figure(5)};
}

void check_storage(database &store, std::int64_t account, std::uint64_t more)
{
    const account_usage usage = usage_of(store, account, 0);
    if (more > 0 && usage.used_storage + more > usage.storage_limit())
        throw refusal(error::storage_exceeded);
}

void count_fetch(database &store, std::int64_t account, const fetch_use &use, std::int64_t now)
{
    // The counts of the day begin anew with the first fetch of a new day.
    store
        .prepare("UPDATE accounts SET bandwidth_used = bandwidth_used + ?2,"
                 " streamed_today = CASE use_day WHEN ?5 THEN streamed_today ELSE 0 END + ?3,"
                 " one_time_today = CASE use_day WHEN ?5 THEN one_time_today ELSE 0 END + ?4,"
                 " use_day = ?5 WHERE id = ?1")
        .bind(account, static_cast<std::int64_t>(use.bytes),
              static_cast<std::int64_t>(use.is_stream ? use.bytes : 0),
              std::int64_t{use.is_one_time}, start_of_day(now))
        .run();
}

} // namespace emulator
