// How far a transfer is, for a person who waits: a bar on a terminal, a line for each file
// elsewhere.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace quillmere::tools {

enum class progress_style { none, lines, bar };

/** A bar where standard error is a terminal, lines where it is none. */
progress_style progress_style_for(bool quiet);

/** A moment of a transfer. */
struct progress_state {
    std::string name;
    std::uint64_t total = 0;
    std::uint64_t done = 0;
    std::uint64_t already = 0; ///< of it, what an earlier transfer had brought
    std::chrono::milliseconds elapsed{0};
};

/** "1.5 MiB"; bytes below 1 KiB as they are. */
std::string size_text(std::uint64_t bytes);

enum class bar_color { none, filled };

/** The bar, no wider than so many columns: name, part, rate and time left. */
std::string bar_text(const progress_state &state, std::size_t columns,
                     bar_color color = bar_color::none);

/** What is told when all is there: name, size, time and rate. */
std::string summary_text(const progress_state &state);

/** Shows one transfer on standard error. The end of the object clears an unfinished bar away. */
class progress {
public:
    progress(progress_style style, std::string name, std::uint64_t total, std::uint64_t already);
    progress(const progress &) = delete;
    progress &operator=(const progress &) = delete;
    ~progress();

    void advance(std::uint64_t bytes);
    /** What had been there already does not count: the transfer begins anew. */
    void restart();
    void finish();

private:
    void draw();
    void clear();

    progress_style style_;
    progress_state state_;
    std::chrono::steady_clock::time_point begun_;
    std::chrono::steady_clock::time_point next_draw_;
    bool drawn_ = false;
};

} // namespace quillmere::tools
