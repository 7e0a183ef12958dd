#include "scripts.h"

namespace quillmere::tools {

namespace {

constexpr const char *fish_machinery = R"fish(
# The command on the line, if there is one yet.
function __quillmere_command
    set -l skipped no
    for word in (commandline -opc)[2..-1]
        if test $skipped = yes
            set skipped no
        else if contains -- $word $__quillmere_values
            set skipped yes
        else if not string match -q -- '-*' $word
            echo $word
            return
        end
    end
end

function __quillmere_is
    set -l command (__quillmere_command)
    contains -- "$command" $argv
end

# What is in the account that the options say, or the profiles there are.
function __quillmere_ask
    set -l words (commandline -opc)
    set -l account
    set -l option # that waits for its value
    for word in $words[2..-1]
        if test -n "$option"
            set -a account $option $word
            set option
        else if contains -- (string replace -r '=.*' '' -- $word) $__quillmere_account_values
            if string match -q -- '*=*' $word
                set -a account $word
            else
                set option $word
            end
        else if contains -- $word $__quillmere_account_flags
            set -a account $word
        end
    end
    command $words[1] $account __complete $argv[1] -- (commandline -ct) 2>/dev/null </dev/null
end

complete -c quillmere -f
)fish";

std::string in_fish_quotes(const std::string &text)
{
    std::string safe;
    for (const char each : text) {
        if (each == '\'' || each == '\\')
            safe += '\\';
        safe += each;
    }
    return "'" + safe + "'";
}

std::string fish_array(const std::string &name, const std::vector<std::string> &words)
{
    return "set -g " + name + " " + joined(words, " ") + "\n";
}

/** How a value is completed. */
std::string value_of(const option_shape &option)
{
    switch (option.value) {
    case value_kind::none:
        return "";
    case value_kind::anything:
        return " -x";
    case value_kind::file:
        return " -r -F";
    case value_kind::profile:
        return " -x -a '(__quillmere_ask profile)'";
    case value_kind::choice:
        return " -x -a " + in_fish_quotes(joined(option.choices, " "));
    }
    return "";
}

std::string option_line(const option_shape &option, const std::string &condition)
{
    std::string line = "complete -c quillmere" + condition;
    for (const std::string &name : option.names)
        line += name.substr(0, 2) == "--" ? " -l " + name.substr(2) : " -s " + name.substr(1);
    return line + value_of(option) + " -d " + in_fish_quotes(option.summary) + "\n";
}

std::string operand_line(const command_shape &command, const std::string &condition)
{
    const std::string beginning = "complete -c quillmere" + condition;
    if (!command.operand_choices.empty())
        return beginning + " -a " + in_fish_quotes(joined(command.operand_choices, " ")) + "\n";
    switch (command.operands) {
    case operand_kind::remote:
        return beginning + " -a '(__quillmere_ask remote)'\n";
    case operand_kind::local_and_remote:
        return beginning + " -F -a '(__quillmere_ask remote)'\n";
    case operand_kind::none:
        break;
    }
    return {};
}

std::string lines_for(const command_shape &command)
{
    const std::string condition = " -n '__quillmere_is " + command.name + "'";
    std::string lines = "complete -c quillmere -n '__quillmere_is \"\"' -a " + command.name +
                        " -d " + in_fish_quotes(command.summary) + "\n";
    for (const option_shape &each : command.options)
        lines += option_line(each, condition);
    return lines + operand_line(command, condition);
}

} // namespace

std::string fish_completion(const program_shape &program)
{
    std::string script =
        "# Completion of quillmere in fish, made by: quillmere completion fish\n\n";
    script += fish_array("__quillmere_values", names_with_value(program));
    script += fish_array("__quillmere_account_values", account_options(program, true));
    script += fish_array("__quillmere_account_flags", account_options(program, false));
    script += fish_machinery;
    for (const option_shape &each : program.options)
        script += option_line(each, "");
    for (const command_shape &each : program.commands)
        script += lines_for(each);
    return script;
}

} // namespace quillmere::tools
