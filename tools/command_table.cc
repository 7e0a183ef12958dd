#include <iterator>

#include "command.h"
#include "commands/commands.h"

namespace quillmere::tools {

namespace {

constexpr command table[] = {
    {"login", "Sign in and keep the session", declare_login, run_login},
    {"logout", "Forget the session", declare_nothing, run_logout},
    {"status", "Show the health of the service's back ends", declare_nothing, run_status},
    {"limits", "Show the limits of the service", declare_nothing, run_limits},
    {"device-status", "Show the revision of the account's file tree", declare_device_status,
     run_device_status},
};

} // namespace

command_range commands() { return {std::begin(table), std::end(table)}; }

} // namespace quillmere::tools
