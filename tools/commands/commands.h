// The functions that the command table names.
#pragma once

#include "../command.h"

namespace quillmere::tools {

/** For a command without options of its own. */
inline void declare_nothing(CLI::App &, arguments &) {}

void declare_login(CLI::App &options, arguments &given);
void declare_login_token(CLI::App &options, arguments &given);
void declare_device_status(CLI::App &options, arguments &given);
void declare_ls(CLI::App &options, arguments &given);
void declare_stat(CLI::App &options, arguments &given);
void declare_mkdir(CLI::App &options, arguments &given);
void declare_create(CLI::App &options, arguments &given);
void declare_rm(CLI::App &options, arguments &given);
void declare_mv(CLI::App &options, arguments &given);
void declare_cp(CLI::App &options, arguments &given);
void declare_set(CLI::App &options, arguments &given);
void declare_put(CLI::App &options, arguments &given);
void declare_get(CLI::App &options, arguments &given);
void declare_update(CLI::App &options, arguments &given);
void declare_links(CLI::App &options, arguments &given);
void declare_mirror(CLI::App &options, arguments &given);
void declare_changes(CLI::App &options, arguments &given);
void declare_attach(CLI::App &options, arguments &given);
void declare_detach(CLI::App &options, arguments &given);

void declare_completion(CLI::App &options, arguments &given);
void declare_complete(CLI::App &options, arguments &given);

void run_login(command_context &context);
void run_logout(command_context &context);
void run_renew(command_context &context);
void run_login_token(command_context &context);
void run_whoami(command_context &context);
void run_status(command_context &context);
void run_limits(command_context &context);
void run_device_status(command_context &context);
void run_ls(command_context &context);
void run_stat(command_context &context);
void run_mkdir(command_context &context);
void run_create(command_context &context);
void run_rm(command_context &context);
void run_mv(command_context &context);
void run_cp(command_context &context);
void run_set(command_context &context);
void run_put(command_context &context);
void run_get(command_context &context);
void run_update(command_context &context);
void run_links(command_context &context);
void run_mirror(command_context &context);
void run_changes(command_context &context);
void run_attach(command_context &context);
void run_detach(command_context &context);
void run_doctor(command_context &context);
void run_quickstart(command_context &context);
void run_completion(command_context &context);
void run_complete(command_context &context);

/** The session for the chosen service; a failure when nobody is signed in there. */
session require_session(command_context &context);

} // namespace quillmere::tools
