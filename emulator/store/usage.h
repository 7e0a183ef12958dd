// What an account may use, and what it has used.
#pragma once

#include <cstdint>

namespace emulator {

class database;

inline constexpr std::uint64_t collaboration_limit = 100;    // folders attached in a day
inline constexpr std::uint64_t one_time_download_limit = 50; // in a day
inline constexpr std::uint64_t streaming_limit = 1073741824; // bytes in a day
inline constexpr std::uint64_t upload_size_limit = 4294967296;

struct account_usage {
    std::uint64_t base_storage = 0;
    std::uint64_t bonus_storage = 0;
    std::uint64_t used_storage = 0;
    std::uint64_t bandwidth_limit = 0;
    std::uint64_t bandwidth_used = 0;
    std::uint64_t streamed_today = 0;
    std::uint64_t one_time_today = 0;

    std::uint64_t storage_limit() const { return base_storage + bonus_storage; }
    bool is_storage_exceeded() const { return used_storage > storage_limit(); }
    std::uint64_t bandwidth_left() const
    {
        return bandwidth_used < bandwidth_limit ? bandwidth_limit - bandwidth_used : 0;
    }
};

/** Days begin at midnight, universal time. */
std::int64_t start_of_day(std::int64_t now);

account_usage usage_of(database &store, std::int64_t account, std::int64_t now);

/** Throws a refusal when the account has no room for this many bytes more. */
void check_storage(database &store, std::int64_t account, std::uint64_t more);

/** What one fetch of bytes uses up. */
struct fetch_use {
    std::uint64_t bytes = 0;
    bool is_stream = false;
    bool is_one_time = false;
};

void count_fetch(database &store, std::int64_t account, const fetch_use &use, std::int64_t now);

} // namespace emulator
