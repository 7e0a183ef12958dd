// Doing a read again after a failure that may pass: how often, and after how long a pause.
#pragma once

#include <chrono>
#include <functional>

#include "exchange.h"

namespace quillmere::tools {

using pause_length = std::chrono::milliseconds;

/**
 * The pause before a repetition: 0.5 s before the first, doubling to 30 s, of which the upper half
 * is left to chance, so that many clients that failed together do not come back together.
 *
 * @param repetition counted from 0
 * @param chance     at least 0, below 1
 */
pause_length pause_before(int repetition, double chance);

/** What repeating needs from the world; a test gives its own. */
struct retry_world {
    std::function<double()> chance;                               ///< at least 0, below 1
    std::function<void(pause_length)> sleep;                      ///< returns after that time
    std::function<void(const exchange &, pause_length)> announce; ///< told before each pause
};

/** The real one, which announces nothing. */
retry_world real_world();

/** Makes an exchange, and again while it is worth it, at most repetitions times; the last one. */
exchange with_repetitions(const std::function<exchange()> &attempt, int repetitions,
                          const retry_world &world);

} // namespace quillmere::tools
