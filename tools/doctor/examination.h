// What may be wrong between a person and the service, looked at step by step.
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "../command.h"
#include "../failure.h"
#include "connection_probe.h"

namespace quillmere::tools {

enum class finding { ok, failed, skipped };

/** "ok", "failed" or "skipped". */
const char *word_for(finding result);

struct examined_step {
    const char *name = "";
    finding result = finding::ok;
    std::optional<std::chrono::microseconds> time;
    std::string detail;               ///< what was found, or why it failed
    std::string advice;               ///< what to try, of a step that failed
    exit_code code = exit_code::done; ///< how the program ends for it
};

using examination = std::vector<examined_step>;

/** Every step in its order. One that rests on a step that failed is skipped. */
examination examine(command_context &context);

/** The steps of a connection, and the clock. */
void add_connection_steps(const connection_probe &found, const settings &chosen,
                          examination &steps);

/** An address without the name and the password that it may hold. */
std::string without_credentials(const std::string &address);

} // namespace quillmere::tools
