// From the argument list to the exit code.
#pragma once

#include "command.h"
#include "environment.h"
#include "results.h"

namespace quillmere::tools {

/** Declares all that can be typed; parsing then fills in what was given and which command it was.
 */
void declare_program(CLI::App &app, arguments &given, const command *&chosen);

/** Runs the command that the arguments name; what it found is in output, what it could not in the
 * exit code. Throws nothing. */
int run_command_line(int count, char **words, const environment &surroundings, results &output);

} // namespace quillmere::tools
