// Standard error: one line for a person at a time.
#pragma once

#include <string>

#include "failure.h"

namespace quillmere::tools {

/** Whether the beginnings of the lines are coloured from now on. */
void color_messages(bool wanted);
bool messages_are_colored();

/** "quillmere: warning: ..." */
void warn(const std::string &message);

/** "quillmere: ...", for what a person who waits should know. */
void note(const std::string &message);

/** "quillmere: ...", for why the program ends. */
void complain(const failure &problem);

} // namespace quillmere::tools
