// The functions that the command table names.
#pragma once

#include "../command.h"

namespace quillmere::tools {

/** For a command without options of its own. */
inline void declare_nothing(CLI::App &, arguments &) {}

void declare_login(CLI::App &options, arguments &given);
void declare_device_status(CLI::App &options, arguments &given);

void run_login(command_context &context);
void run_logout(command_context &context);
void run_status(command_context &context);
void run_limits(command_context &context);
void run_device_status(command_context &context);

/** The session for the chosen service; a failure when nobody is signed in there. */
session require_session(command_context &context);

} // namespace quillmere::tools
