// What a command is: a row of a table. A new command is a row and the functions it names.
#pragma once

#include <functional>

#include "arguments.h"
#include "environment.h"
#include "profile.h"
#include "results.h"
#include "service.h"
#include "session_file.h"
#include "settings.h"

namespace CLI {
class App;
}

namespace quillmere::tools {

/** What a command works with. */
struct command_context {
    const arguments &given;
    const environment &surroundings;
    const profile &chosen_profile;
    const session_file &sessions;
    const std::function<const settings &()> chosen; ///< decided at the first call
    const std::function<service &()> remote;        ///< started at the first call
    results &output;
};

/** What the words behind a command are, for a shell that completes them. */
enum class operand_kind { none, remote, local_and_remote };

struct command {
    const char *name;
    const char *summary;
    void (*declare)(CLI::App &options, arguments &given);
    void (*run)(command_context &context); ///< throws failure, or told_failure
    operand_kind operands = operand_kind::none;

    /** Not one that people type. */
    bool is_hidden() const { return name[0] == '_'; }
};

struct command_range {
    const command *first;
    const command *last;
    const command *begin() const { return first; }
    const command *end() const { return last; }
};

/** Every command, in the order in which help lists them. */
command_range commands();

} // namespace quillmere::tools
