// Times as they are written in requests and replies: universal time.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace emulator {

/** "2026-03-01 09:30:00" */
std::string time_text(std::int64_t seconds);
/** "2026-03-01" */
std::string date_text(std::int64_t seconds);
/** "Sun, 01 Mar 2026 09:30:00 GMT", as the header of a reply has it (RFC 9110, 5.6.7). */
std::string http_date(std::int64_t seconds);

/**
 * Seconds since 1970 from a decimal number of them, or from a date and time as above, where a "T"
 * may replace the blank and a "Z" may follow. Nothing for any other text.
 */
std::optional<std::int64_t> parse_time(std::string_view text);

} // namespace emulator
