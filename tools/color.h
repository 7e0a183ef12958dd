// Colours for a person who looks: what is painted how, and whether it is.
#pragma once

#include <string>
#include <string_view>

#include "environment.h"

namespace quillmere::tools {

enum class color_choice { automatic, always, never };

/** The words that --color takes. */
constexpr const char *color_words[] = {"auto", "always", "never"};

/** What the words of a command line say of --color, the last that does. Asked of the words
 * themselves, because an error among them must have its colour, too. */
color_choice color_choice_in(int count, const char *const *words);

/**
 * Whether what is written to a place is coloured. Left to itself that is a terminal that knows
 * colours, and NO_COLOR is heeded; whoever says always or never means it.
 */
bool wants_color(color_choice choice, const environment &surroundings, bool is_terminal);

enum class paint { heading, folder, progress, good, caution, bad };

/** The text in its colour, and what follows in none. */
std::string painted(std::string_view text, paint how);

} // namespace quillmere::tools
