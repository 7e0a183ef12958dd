// A first look without an account.

#include "commands.h"

#include <csignal>

#include "../failure.h"
#include "../quickstart/trial.h"

namespace quillmere::tools {

namespace {

// As a signal does that finds nothing to be put away.
[[noreturn]] void end_as_asked(int signal_number)
{
    if (signal_number != SIGINT) {
        ::signal(signal_number, SIG_DFL);
        ::raise(signal_number);
    }
    throw told_failure{exit_code::interrupted};
}

} // namespace

void run_quickstart(command_context &context)
{
    try {
        trial(context).run();
    } catch (const asked_to_end &asked) {
        end_as_asked(asked.signal_number);
    }
}

} // namespace quillmere::tools
