// From the argument list to the exit code.
#pragma once

#include "environment.h"
#include "results.h"

namespace quillmere::tools {

/** Runs the command that the arguments name; what it found is in output, what it could not in the
 * exit code. Throws nothing. */
int run_command_line(int count, char **words, const environment &surroundings, results &output);

} // namespace quillmere::tools
