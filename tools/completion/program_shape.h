// What can be typed behind the program's name: the commands and options as they are declared, with
// what a shell has to know to complete them.
#pragma once

#include <string>
#include <vector>

#include "../command.h"

namespace quillmere::tools {

enum class value_kind { none, anything, file, profile, choice };

struct option_shape {
    std::vector<std::string> names; ///< "-l", "--long"
    std::string summary;
    value_kind value = value_kind::none;
    std::vector<std::string> choices;
};

struct command_shape {
    std::string name;
    std::string summary;
    std::vector<option_shape> options;
    operand_kind operands = operand_kind::none;
    std::vector<std::string> operand_choices;
};

struct program_shape {
    std::vector<option_shape> options; ///< of every command
    std::vector<command_shape> commands;
};

program_shape shape_of_program();

/** The names of all options that take a value, each once. */
std::vector<std::string> names_with_value(const program_shape &program);

/** The names of the options that decide which account is looked at, with a value or without:
 * whoever completes what is in the account has to pass them on. */
std::vector<std::string> account_options(const program_shape &program, bool with_value);

/** The words with a text between them. */
std::string joined(const std::vector<std::string> &words, const std::string &between);

} // namespace quillmere::tools
