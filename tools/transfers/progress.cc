#include "progress.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

#include <sys/ioctl.h>

#include "../color.h"
#include "../console.h"
#include "../descriptor.h"
#include "../interrupt.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

using std::chrono::milliseconds;

constexpr milliseconds between_draws{100};
constexpr std::size_t usual_columns = 80;
constexpr std::size_t file_name_columns = 24;
constexpr std::size_t smallest_bar = 10;
constexpr const char *clear_line = "\r\x1b[K";

std::size_t terminal_columns()
{
    winsize size = {};
    if (::ioctl(STDERR_FILENO, TIOCGWINSZ, &size) != 0 || size.ws_col == 0)
        return usual_columns;
    return size.ws_col;
}

double rate_of(const progress_state &state)
{
    const double seconds = std::max(0.001, std::chrono::duration<double>(state.elapsed).count());
    return static_cast<double>(state.done - state.already) / seconds;
}

std::string rate_text(const progress_state &state)
{
    return size_text(static_cast<std::uint64_t>(rate_of(state))) + "/s";
}

// "0:07", "1:02:03"
std::string time_text(std::uint64_t seconds)
{
    char text[32];
    if (seconds >= 3600)
        std::snprintf(text, sizeof text, "%llu:%02llu:%02llu",
                      static_cast<unsigned long long>(seconds / 3600),
                      static_cast<unsigned long long>(seconds / 60 % 60),
                      static_cast<unsigned long long>(seconds % 60));
    else
        std::snprintf(text, sizeof text, "%llu:%02llu",
                      static_cast<unsigned long long>(seconds / 60),
                      static_cast<unsigned long long>(seconds % 60));
    return text;
}

std::string time_left_text(const progress_state &state)
{
    const double rate = rate_of(state);
    if (rate < 1)
        return "-:--";
    const double left = static_cast<double>(state.total - std::min(state.done, state.total));
    return time_text(static_cast<std::uint64_t>(std::ceil(left / rate)));
}

// Cut in the middle of no character: what is left of a name must still be one.
std::string shortened(const std::string &text, std::size_t most)
{
    if (columns(text) <= most)
        return text;
    std::size_t end = text.size();
    while (columns(std::string_view(text).substr(0, end)) + 3 > most && end > 0)
        do
            --end;
        while (end > 0 && (static_cast<unsigned char>(text[end]) & 0xc0) == 0x80);
    return text.substr(0, end) + "...";
}

std::string bar_of(double part, std::size_t width, bar_color color)
{
    const auto filled = static_cast<std::size_t>(part * static_cast<double>(width));
    std::string done(filled, '=');
    if (color == bar_color::filled)
        done = painted(done, paint::progress);
    return "[" + done + std::string(width - filled, ' ') + "]";
}

} // namespace

progress_style progress_style_for(bool quiet)
{
    if (quiet)
        return progress_style::none;
    return ::isatty(STDERR_FILENO) == 1 ? progress_style::bar : progress_style::lines;
}

std::string size_text(std::uint64_t bytes)
{
    constexpr const char *units[] = {"KiB", "MiB", "GiB", "TiB"};
    if (bytes < 1024)
        return std::to_string(bytes) + " B";
    double size = static_cast<double>(bytes) / 1024;
    std::size_t unit = 0;
    for (; size >= 1023.95 && unit + 1 < std::size(units); ++unit) // which would print as 1024.0
        size /= 1024;
    char text[32];
    std::snprintf(text, sizeof text, "%.1f %s", size, units[unit]);
    return text;
}

std::string bar_text(const progress_state &state, std::size_t columns_given, bar_color color)
{
    const double part = state.total == 0 ? 1
                                         : static_cast<double>(std::min(state.done, state.total)) /
                                               static_cast<double>(state.total);
    char percent[16];
    std::snprintf(percent, sizeof percent, "%3d%%", static_cast<int>(part * 100));
    const std::string name = shortened(escape_controls(state.name), file_name_columns);
    const std::string before = name + "  " + percent + "  ";
    const std::string behind =
        "  " + size_text(state.done) + "  " + rate_text(state) + "  " + time_left_text(state);
    const std::size_t taken = columns(before) + behind.size() + 2; // the brackets
    if (taken + smallest_bar > columns_given)
        return shortened(name + "  " + percent + behind, columns_given);
    return before + bar_of(part, std::min(columns_given - taken, std::size_t{40}), color) + behind;
}

std::string summary_text(const progress_state &state)
{
    const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(state.elapsed);
    return state.name + "  " + size_text(state.total) + "  in " +
           time_text(static_cast<std::uint64_t>(seconds.count())) + "  " + rate_text(state);
}

progress::progress(progress_style style, std::string name, std::uint64_t total,
                   std::uint64_t already)
    : style_(style), state_{std::move(name), total, already, already, milliseconds(0)},
      begun_(std::chrono::steady_clock::now()), next_draw_(begun_)
{
    draw();
}

progress::~progress() { clear(); }

void progress::advance(std::uint64_t bytes)
{
    state_.done += bytes;
    draw();
}

void progress::restart()
{
    state_.done = 0;
    state_.already = 0;
    draw();
}

void progress::finish()
{
    state_.elapsed =
        std::chrono::duration_cast<milliseconds>(std::chrono::steady_clock::now() - begun_);
    clear();
    if (style_ != progress_style::none)
        note(summary_text(state_));
}

void progress::draw()
{
    const auto now = std::chrono::steady_clock::now();
    if (style_ != progress_style::bar || now < next_draw_)
        return;
    next_draw_ = now + between_draws;
    state_.elapsed = std::chrono::duration_cast<milliseconds>(now - begun_);
    drawn_ = true;
    mark_open_line(true);
    // The last column stays free: a terminal may go to the next line behind it.
    const bar_color color = messages_are_colored() ? bar_color::filled : bar_color::none;
    write_all(STDERR_FILENO, clear_line + bar_text(state_, terminal_columns() - 1, color));
}

void progress::clear()
{
    if (!drawn_)
        return;
    write_all(STDERR_FILENO, clear_line);
    mark_open_line(false);
    drawn_ = false;
}

} // namespace quillmere::tools
