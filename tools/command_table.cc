#include <iterator>

#include "command.h"
#include "commands/commands.h"

namespace quillmere::tools {

namespace {

constexpr operand_kind remote = operand_kind::remote;
constexpr operand_kind local_and_remote = operand_kind::local_and_remote;

constexpr command table[] = {
    {"login", "Sign in and keep the session", declare_login, run_login},
    {"logout", "Forget the session", declare_nothing, run_logout},
    {"renew", "Trade the session for a fresh one", declare_nothing, run_renew},
    {"login-token", "Get a token that signs in once, elsewhere", declare_login_token,
     run_login_token},
    {"whoami", "Show the account, its limits and their use", declare_nothing, run_whoami},
    {"status", "Show the health of the service's back ends", declare_nothing, run_status},
    {"limits", "Show the limits of the service", declare_nothing, run_limits},
    {"device-status", "Show the revision of the account's file tree", declare_device_status,
     run_device_status},
    {"ls", "List a folder", declare_ls, run_ls, remote},
    {"stat", "Show all that is known of a folder or file", declare_stat, run_stat, remote},
    {"mkdir", "Create a folder", declare_mkdir, run_mkdir, remote},
    {"create", "Create an empty file", declare_create, run_create, remote},
    {"rm", "Remove a folder or file", declare_rm, run_rm, remote},
    {"mv", "Move or rename a folder or file", declare_mv, run_mv, remote},
    {"cp", "Copy a folder or file", declare_cp, run_cp, remote},
    {"set", "Change a name, description, tags, privacy or time", declare_set, run_set, remote},
    {"put", "Upload files and folders", declare_put, run_put, local_and_remote},
    {"get", "Download files and folders", declare_get, run_get, local_and_remote},
    {"mirror", "Keep a local copy of a folder", declare_mirror, run_mirror, local_and_remote},
    {"update", "Upload a new revision of a file", declare_update, run_update, local_and_remote},
    {"links", "Show the links of a file", declare_links, run_links, remote},
    {"changes", "Show what changed since a revision", declare_changes, run_changes},
    {"attach", "Attach a folder of another account", declare_attach, run_attach},
    {"detach", "Detach such a folder again", declare_detach, run_detach, remote},
    {"doctor", "Find out what is wrong, and what to try", declare_nothing, run_doctor},
    {"quickstart", "See it all at work on this machine, without an account", declare_nothing,
     run_quickstart},
    {"completion", "Print the completion script for a shell", declare_completion, run_completion},
    {"__complete", "Answer a shell that completes a word", declare_complete, run_complete},
};

} // namespace

command_range commands() { return {std::begin(table), std::end(table)}; }

} // namespace quillmere::tools
