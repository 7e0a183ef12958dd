#include "scripts.h"

namespace quillmere::tools {

namespace {

constexpr const char *zsh_machinery = R"zsh(
# What is in the account, or the profiles there are; words are asked for as if they were not quoted.
_quillmere_ask()
{
    local -a found
    found=("${(@f)$("$program" "${account[@]}" __complete "$1" -- "${(Q)PREFIX}" 2>/dev/null </dev/null)}")
    found=(${found:#})
    compadd -S '' -- ${(M)found:#*/}
    compadd -- ${found:#*/}
}

_quillmere_remote() { _quillmere_ask remote }
_quillmere_profile() { _quillmere_ask profile }
_quillmere_both() { _quillmere_remote; _files }

_quillmere()
{
    local curcontext=$curcontext context state state_descr line i program=$words[1]
    local -A opt_args
    local -a account
    for ((i = 2; i < CURRENT; i++)); do
        if ((${_quillmere_account_values[(Ie)${words[i]%%=*}]})); then
            if [[ $words[i] == *=* ]]; then
                account+=("${(Q)words[i]}")
            elif ((++i < CURRENT)); then # or it is the value that is typed just now
                account+=("$words[i-1]" "${(Q)words[i]}")
            fi
        elif ((${_quillmere_account_flags[(Ie)$words[i]]})); then
            account+=("$words[i]")
        fi
    done
    _arguments -C $_quillmere_options '1:command:->command' '*::argument:->operand'
    case $state in
    command) _describe command _quillmere_commands ;;
    operand) _quillmere_operand ;;
    esac
}

if [ "$funcstack[1]" = _quillmere ]; then
    _quillmere "$@"
else
    compdef _quillmere quillmere
fi
)zsh";

std::string in_zsh_quotes(const std::string &text)
{
    std::string safe;
    for (const char each : text)
        safe += each == '\'' ? std::string("'\\''") : std::string(1, each);
    return "'" + safe + "'";
}

std::string escaped(const std::string &text, const std::string &special)
{
    std::string safe;
    for (const char each : text) {
        if (special.find(each) != std::string::npos)
            safe += '\\';
        safe += each;
    }
    return safe;
}

/** What stands behind a value's name: how it is completed. */
std::string action_of(value_kind value, const std::vector<std::string> &choices)
{
    switch (value) {
    case value_kind::file:
        return "_files";
    case value_kind::profile:
        return "_quillmere_profile";
    case value_kind::choice:
        return "(" + joined(choices, " ") + ")";
    case value_kind::none:
    case value_kind::anything:
        break;
    }
    return " ";
}

std::string specifications_of(const std::vector<option_shape> &options, const std::string &indent)
{
    std::string lines;
    for (const option_shape &option : options) {
        for (const std::string &name : option.names) {
            const bool is_long = name.substr(0, 2) == "--";
            const bool takes_value = option.value != value_kind::none;
            std::string text = "(" + joined(option.names, " ") + ")" + name;
            text += takes_value && is_long ? "=" : "";
            text += "[" + escaped(option.summary, "[]\\") + "]";
            if (takes_value)
                text += ":value:" + action_of(option.value, option.choices);
            lines += indent + in_zsh_quotes(text) + "\n";
        }
    }
    return lines;
}

std::string operands_of(const command_shape &command)
{
    if (!command.operand_choices.empty())
        return in_zsh_quotes("1:word:(" + joined(command.operand_choices, " ") + ")");
    switch (command.operands) {
    case operand_kind::remote:
        return in_zsh_quotes("*:path:_quillmere_remote");
    case operand_kind::local_and_remote:
        return in_zsh_quotes("*:path:_quillmere_both");
    case operand_kind::none:
        break;
    }
    return {};
}

std::string zsh_array(const std::string &name, const std::vector<std::string> &words)
{
    return name + "=(" + joined(words, " ") + ")\n";
}

std::string commands_array(const program_shape &program)
{
    std::string lines = "_quillmere_commands=(\n";
    for (const command_shape &each : program.commands)
        lines += "    " + in_zsh_quotes(escaped(each.name, ":") + ":" + each.summary) + "\n";
    return lines + ")\n";
}

std::string zsh_operands(const program_shape &program)
{
    std::string text = "\n_quillmere_operand()\n{\n    case $words[1] in\n";
    for (const command_shape &each : program.commands) {
        text += "    " + each.name + ")\n        _arguments $_quillmere_options ";
        const std::string operands = operands_of(each);
        text += operands + " \\\n            ";
        std::string specifications;
        for (const option_shape &option : each.options) {
            std::string lines = specifications_of({option}, "");
            for (std::size_t at = 0; (at = lines.find('\n', at)) != std::string::npos;)
                lines.replace(at, 1, " ");
            specifications += lines;
        }
        text += specifications + "\n        ;;\n";
    }
    return text + "    esac\n}\n";
}

} // namespace

std::string zsh_completion(const program_shape &program)
{
    return "#compdef quillmere\n"
           "# Completion of quillmere in zsh, made by: quillmere completion zsh\n\n"
           "typeset -ga _quillmere_commands _quillmere_options\n"
           "typeset -ga _quillmere_account_values _quillmere_account_flags\n" +
           commands_array(program) + "_quillmere_options=(\n" +
           specifications_of(program.options, "    ") + ")\n" +
           zsh_array("_quillmere_account_values", account_options(program, true)) +
           zsh_array("_quillmere_account_flags", account_options(program, false)) +
           zsh_operands(program) + zsh_machinery;
}

} // namespace quillmere::tools
