#include "times.h"

#include <ctime>
#include <iomanip>
#include <locale>
#include <sstream>

#include "text.h"

namespace emulator {
namespace {

constexpr std::uint64_t latest = 253402300799; // the last second of the year 9999

std::tm parts_of(std::int64_t seconds)
{
    const std::time_t when = seconds;
    std::tm parts{};
    ::gmtime_r(&when, &parts);
    return parts;
}

// Whatever language the machine speaks, the names of days and months are English.
std::string formatted(std::int64_t seconds, const char *form)
{
    const std::tm parts = parts_of(seconds);
    std::ostringstream text;
    text.imbue(std::locale::classic());
    text << std::put_time(&parts, form);
    return text.str();
}

bool is_date_and_time(std::string_view text)
{
    constexpr std::string_view form = "0000-00-00 00:00:00";
    if (text.size() != form.size())
        return false;
    for (std::size_t at = 0; at < form.size(); ++at) {
        const bool wants_digit = form[at] == '0';
        const bool is_digit = text[at] >= '0' && text[at] <= '9';
        const bool matches = text[at] == form[at] || (at == 10 && text[at] == 'T');
        if (wants_digit ? !is_digit : !matches)
            return false;
    }
    return true;
}

int part(std::string_view text, std::size_t at, std::size_t length)
{
    return static_cast<int>(*parse_decimal(text.substr(at, length), 9999));
}

} // namespace

std::string time_text(std::int64_t seconds) { return formatted(seconds, "%Y-%m-%d %H:%M:%S"); }

std::string date_text(std::int64_t seconds) { return time_text(seconds).substr(0, 10); }

std::string http_date(std::int64_t seconds)
{
    return formatted(seconds, "%a, %d %b %Y %H:%M:%S GMT");
}

std::optional<std::int64_t> parse_time(std::string_view text)
{
    if (const auto seconds = parse_decimal(text, latest))
        return static_cast<std::int64_t>(*seconds);
    if (!text.empty() && text.back() == 'Z')
        text.remove_suffix(1);
    if (!is_date_and_time(text))
        return std::nullopt;
    std::tm parts{};
    parts.tm_year = part(text, 0, 4) - 1900;
    parts.tm_mon = part(text, 5, 2) - 1;
    parts.tm_mday = part(text, 8, 2);
    parts.tm_hour = part(text, 11, 2);
    parts.tm_min = part(text, 14, 2);
    parts.tm_sec = part(text, 17, 2);
    const std::int64_t seconds = ::timegm(&parts);
    // A day that no calendar has, such as the 30th of February, comes back as another one.
    const std::string again = time_text(seconds);
    if (again.substr(0, 10) != text.substr(0, 10) || again.substr(11) != text.substr(11))
        return std::nullopt;
    return seconds;
}

} // namespace emulator
