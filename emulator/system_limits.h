// The numbers that the service tells its clients; sizes are bytes.
#pragma once

#include <cstdint>

namespace emulator::system_limits {

inline constexpr std::uint64_t max_objects = 500;
inline constexpr std::uint64_t max_keys = 500;
inline constexpr std::uint64_t max_image_size = 32 << 20;
inline constexpr std::uint64_t zip_max_filesize = 200 << 20;
inline constexpr std::uint64_t zip_max_total_filesize = 1000 << 20;
inline constexpr std::uint64_t folder_content_chunk_size = 100;
inline constexpr std::uint64_t folder_depth_limit = 100;
inline constexpr std::uint64_t limit_search_results = 200;
inline constexpr std::uint64_t daily_shares_limit = 100;
inline constexpr std::uint64_t device_changes_list_limit = 500;

} // namespace emulator::system_limits
