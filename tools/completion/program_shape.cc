#include "program_shape.h"

#include <algorithm>

#include <CLI/CLI.hpp>

#include "../command_line.h"

namespace quillmere::tools {

namespace {

constexpr const char *account_names[] = {"--service",      "--emulator",  "--profile",
                                         "--ca-file",      "--insecure",  "--proxy",
                                         "--session-file", "--plain-http"};

// A check of membership describes itself as "{a,b}"; nothing else tells what it takes.
std::vector<std::string> choices_of(const CLI::Option &option)
{
    const std::string type = option.get_type_name();
    const std::size_t begin = type.find('{');
    const std::size_t end = type.rfind('}');
    if (begin == std::string::npos || end == std::string::npos)
        return {};
    return CLI::detail::split(type.substr(begin + 1, end - begin - 1), ',');
}

std::vector<std::string> names_of(const CLI::Option &option)
{
    std::vector<std::string> names;
    for (const std::string &each : option.get_snames())
        names.push_back("-" + each);
    for (const std::string &each : option.get_lnames())
        names.push_back("--" + each);
    return names;
}

value_kind value_of(const CLI::Option &option, const option_shape &shape)
{
    if (option.get_items_expected_max() == 0)
        return value_kind::none;
    if (!shape.choices.empty())
        return value_kind::choice;
    if (option.get_option_text() == "FILE")
        return value_kind::file;
    const bool names_profile = shape.names.front() == "--profile";
    return names_profile ? value_kind::profile : value_kind::anything;
}

option_shape shape_of(const CLI::Option &option)
{
    option_shape shape;
    shape.names = names_of(option);
    shape.summary = option.get_description();
    shape.choices = choices_of(option);
    shape.value = value_of(option, shape);
    return shape;
}

std::vector<option_shape> options_of(const CLI::App &app)
{
    std::vector<option_shape> options;
    for (const CLI::Option *each : app.get_options())
        if (!names_of(*each).empty())
            options.push_back(shape_of(*each));
    return options;
}

std::vector<std::string> operand_choices_of(const CLI::App &app)
{
    for (const CLI::Option *each : app.get_options())
        if (names_of(*each).empty())
            return choices_of(*each);
    return {};
}

template <class Wanted>
std::vector<std::string> names_of_those(const program_shape &program, Wanted wanted)
{
    std::vector<std::string> names;
    const auto add = [&](const std::vector<option_shape> &options) {
        for (const option_shape &option : options)
            for (const std::string &name : option.names)
                if (wanted(option) && std::find(names.begin(), names.end(), name) == names.end())
                    names.push_back(name);
    };
    add(program.options);
    for (const command_shape &command : program.commands)
        add(command.options);
    return names;
}

} // namespace

program_shape shape_of_program()
{
    CLI::App app;
    arguments given;
    const command *chosen = nullptr;
    declare_program(app, given, chosen);

    program_shape program;
    program.options = options_of(app);
    for (const command &row : commands()) {
        if (row.is_hidden())
            continue;
        const CLI::App &options = *app.get_subcommand(row.name);
        program.commands.push_back({row.name, row.summary, options_of(options), row.operands,
                                    operand_choices_of(options)});
    }
    return program;
}

std::vector<std::string> names_with_value(const program_shape &program)
{
    return names_of_those(program,
                          [](const option_shape &each) { return each.value != value_kind::none; });
}

std::vector<std::string> account_options(const program_shape &program, bool with_value)
{
    return names_of_those(program, [with_value](const option_shape &each) {
        const bool chooses = std::find(std::begin(account_names), std::end(account_names),
                                       each.names.front()) != std::end(account_names);
        return chooses && (each.value != value_kind::none) == with_value;
    });
}

std::string joined(const std::vector<std::string> &words, const std::string &between)
{
    std::string text;
    for (const std::string &each : words)
        text += (text.empty() ? "" : between) + each;
    return text;
}

} // namespace quillmere::tools
