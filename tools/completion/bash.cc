#include "scripts.h"

namespace quillmere::tools {

namespace {

// Everything but the tables, which stand before it.
constexpr const char *bash_machinery = R"bash(
# The words up to the cursor as they were typed: bash takes them apart at ":" and "=", too.
_quillmere_split()
{
    local rest=${COMP_LINE:0:COMP_POINT} stripped piece i
    words=()
    for ((i = 0; i <= COMP_CWORD; i++)); do
        stripped=${rest#"${rest%%[![:blank:]]*}"}
        piece=${COMP_WORDS[i]}
        ((i < COMP_CWORD)) || piece=$stripped
        if ((i > 0)) && [[ $stripped == "$rest" ]]; then
            words[-1]+=$piece
        else
            words+=("$piece")
        fi
        rest=${stripped#"$piece"}
    done
    replaced=$piece # what bash puts a completion in the place of
    [[ $replaced != [:=] ]] || replaced=
}

# Finds the command, and the options that say which account is meant.
_quillmere_scan()
{
    local i word
    command='' account=()
    for ((i = 1; i < ${#words[@]} - 1; i++)); do
        word=${words[i]}
        if [[ " $_quillmere_account_values " == *" ${word%%=*} "* ]]; then
            if [[ $word == *=* ]]; then
                account+=("$(_quillmere_unquoted "$word")")
            elif ((++i < ${#words[@]} - 1)); then # or it is the value that is typed just now
                account+=("$word" "$(_quillmere_unquoted "${words[i]}")")
            fi
        elif [[ " $_quillmere_account_flags " == *" $word "* ]]; then
            account+=("$word")
        elif [[ " $_quillmere_values " == *" $word "* ]]; then
            ((++i))
        elif [[ $word != -* && -z $command ]]; then
            command=$word
        fi
    done
}

_quillmere_unquoted()
{
    local text=${1//\\/}
    text=${text#[\"\']}
    printf '%s' "${text%[\"\']}"
}

_quillmere_offer() # words
{
    mapfile -t -O "${#COMPREPLY[@]}" COMPREPLY < <(compgen -W "$1" -- "$current")
}

_quillmere_offer_files()
{
    mapfile -t -O "${#COMPREPLY[@]}" COMPREPLY < <(compgen -f -- "$(_quillmere_unquoted "$current")")
    compopt -o filenames 2>/dev/null
}

_quillmere_ask() # what: "remote" or "profile"
{
    mapfile -t -O "${#COMPREPLY[@]}" COMPREPLY < <(
        "${words[0]}" "${account[@]}" __complete "$1" -- "$(_quillmere_unquoted "$current")" \
            2>/dev/null </dev/null)
    [[ $1 != remote ]] || compopt -o filenames 2>/dev/null
    if ((${#COMPREPLY[@]} == 1)) && [[ ${COMPREPLY[0]} == */ ]]; then
        compopt -o nospace 2>/dev/null
    fi
}

_quillmere()
{
    local current previous command replaced i
    local -a words account
    COMPREPLY=()
    _quillmere_split
    _quillmere_scan
    current=${words[-1]} previous=${words[-2]}
    if [[ $current == --*=* ]]; then
        previous=${current%%=*} current=${current#*=}
        replaced=${replaced#"$previous="}
    fi
    if [[ " $_quillmere_values " == *" $previous "* ]]; then
        _quillmere_value
    elif [[ $current == -* ]]; then
        _quillmere_offer "$_quillmere_options $(_quillmere_options_of)"
    elif [[ -z $command ]]; then
        _quillmere_offer "$_quillmere_commands"
    else
        _quillmere_operand
    fi
    for ((i = 0; i < ${#COMPREPLY[@]}; i++)); do
        COMPREPLY[i]=${COMPREPLY[i]#"${current%"$replaced"}"}
    done
}

complete -F _quillmere quillmere
)bash";

std::string assignment(const std::string &name, const std::vector<std::string> &words)
{
    return name + "='" + joined(words, " ") + "'\n";
}

std::vector<std::string> names_in(const std::vector<option_shape> &options)
{
    std::vector<std::string> names;
    for (const option_shape &each : options)
        names.insert(names.end(), each.names.begin(), each.names.end());
    return names;
}

std::string case_of(const std::string &pattern, const std::string &action)
{
    return "    " + pattern + ") " + action + " ;;\n";
}

std::string offer(const std::vector<std::string> &words)
{
    return "_quillmere_offer '" + joined(words, " ") + "'";
}

std::string value_cases(const std::vector<option_shape> &options, const std::string &command)
{
    std::string cases;
    for (const option_shape &each : options) {
        const std::string pattern = command + ":" + joined(each.names, "|" + command + ":");
        if (each.value == value_kind::choice)
            cases += case_of(pattern, offer(each.choices));
        else if (each.value == value_kind::file)
            cases += case_of(pattern, "_quillmere_offer_files");
        else if (each.value == value_kind::profile)
            cases += case_of(pattern, "_quillmere_ask profile");
    }
    return cases;
}

std::string value_function(const program_shape &program)
{
    std::string cases = value_cases(program.options, "*");
    for (const command_shape &each : program.commands)
        cases += value_cases(each.options, each.name);
    return "\n_quillmere_value()\n{\n    case $command:$previous in\n" + cases + "    esac\n}\n";
}

std::string options_function(const program_shape &program)
{
    std::string cases;
    for (const command_shape &each : program.commands)
        cases += case_of(each.name, "printf '%s' '" + joined(names_in(each.options), " ") + "'");
    return "\n_quillmere_options_of()\n{\n    case $command in\n" + cases + "    esac\n}\n";
}

std::string bash_operands(const program_shape &program)
{
    std::string cases;
    for (const command_shape &each : program.commands) {
        if (!each.operand_choices.empty())
            cases += case_of(each.name, offer(each.operand_choices));
        else if (each.operands == operand_kind::remote)
            cases += case_of(each.name, "_quillmere_ask remote");
        else if (each.operands == operand_kind::local_and_remote)
            cases += case_of(each.name, "_quillmere_ask remote; _quillmere_offer_files");
    }
    return "\n_quillmere_operand()\n{\n    case $command in\n" + cases + "    esac\n}\n";
}

std::vector<std::string> command_names(const program_shape &program)
{
    std::vector<std::string> names;
    for (const command_shape &each : program.commands)
        names.push_back(each.name);
    return names;
}

} // namespace

std::string bash_completion(const program_shape &program)
{
    return "# Completion of quillmere in bash, made by: quillmere completion bash\n"
           "# shellcheck shell=bash\n\n" +
           assignment("_quillmere_commands", command_names(program)) +
           assignment("_quillmere_options", names_in(program.options)) +
           assignment("_quillmere_values", names_with_value(program)) +
           assignment("_quillmere_account_values", account_options(program, true)) +
           assignment("_quillmere_account_flags", account_options(program, false)) +
           options_function(program) + value_function(program) + bash_operands(program) +
           bash_machinery;
}

} // namespace quillmere::tools
