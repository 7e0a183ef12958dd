// The state of the account as a device sees it.

#include "commands.h"

#include <CLI/CLI.hpp>
#include <quillmere.h>

namespace quillmere::tools {

void declare_device_status(CLI::App &options, arguments &given)
{
    options
        .add_option("--device-id", given.device_status.device_id,
                    "Number of the device; 0 unless given")
        ->option_text("NUMBER");
}

void run_device_status(command_context &context)
{
    const session current = require_session(context);
    const std::uint32_t device = context.given.device_status.device_id;
    std::uint64_t revision = 0;
    std::int32_t jobs = 0;
    context.remote().read("reading the device's status", [&](char **error_message) {
        return get_device_status(current.token.c_str(), device, &revision, &jobs, error_message);
    });
    context.output.facts({{"device_id", "Device", device},
                          {"device_revision", "Revision", revision},
                          {"async_jobs_in_progress", "Jobs in progress", jobs != 0}});
}

} // namespace quillmere::tools
