// The options and commands of the program.
#pragma once

namespace emulator {

/** Does what the arguments ask. Returns the exit code: 0 done, 1 failed, 2 wrong usage. */
int run_command_line(int argc, char **argv);

} // namespace emulator
