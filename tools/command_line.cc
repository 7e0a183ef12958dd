#include "command_line.h"

#include <cstring>
#include <optional>

#include <CLI/CLI.hpp>
#include <quillmere.h>

#include "color.h"
#include "command.h"
#include "console.h"
#include "failure.h"

namespace quillmere::tools {

namespace {

constexpr const char *see_help = "see: quillmere --help";

std::string version_text()
{
    return "quillmere " + std::to_string(QUILLMERE_VERSION_MAJOR) + "." +
           std::to_string(QUILLMERE_VERSION_MINOR) + "." + std::to_string(QUILLMERE_VERSION_PATCH);
}

void declare_service_options(CLI::App &app, common_arguments &given)
{
    auto *const service =
        app.add_option("--service", given.service, "Base address of the service (https://host)")
            ->option_text("URL");
    app.add_option("--emulator", given.emulator, "Talk to the emulator that wrote this ready file")
        ->option_text("FILE")
        ->excludes(service);
    app.add_option("--profile", given.profile, "Section of the configuration file to use")
        ->option_text("NAME");
    auto *const ca_file =
        app.add_option("--ca-file", given.ca_file, "Certificate authorities to trust, in PEM form")
            ->option_text("FILE");
    app.add_flag("--insecure", given.insecure, "Do not verify the service's certificate")
        ->option_text(" ")
        ->excludes(ca_file);
    app.add_flag("--plain-http", given.plain_http,
                 "Leave requests unencrypted that the service takes so");
    app.add_option("--proxy", given.proxy, "Proxy on the way to the service (http://host:port)")
        ->option_text("URL");
    app.add_option("--session-file", given.session_file, "Where the session is kept")
        ->option_text("FILE");
}

void declare_conduct_options(CLI::App &app, common_arguments &given)
{
    app.add_option("--timeout", given.timeout, "Time for one attempt; 30 unless given")
        ->option_text("SECONDS")
        ->check(CLI::Range(1, 86400));
    app.add_option("--retries", given.retries, "Repetitions of a read that failed; 4 unless given")
        ->option_text("COUNT")
        ->check(CLI::Range(0, 1000));
    app.add_flag("--json", given.json, "Print results and errors as JSON");
    app.add_option("--color", given.color, "Whether text is coloured: auto, always or never")
        ->option_text("WHEN")
        ->check(CLI::IsMember(
            std::vector<std::string>(std::begin(color_words), std::end(color_words))));
    app.add_flag("-v,--verbose", given.verbose, "Show the exchanges on standard error");
    app.add_option("--log-file", given.log_file, "Append the exchanges to a file")
        ->option_text("FILE");
}

void declare_commands(CLI::App &app, arguments &given, const command *&chosen)
{
    for (const command &row : commands()) {
        CLI::App *const options = app.add_subcommand(row.name, row.summary);
        if (row.is_hidden())
            options->group("");
        options->fallthrough(); // common options may stand behind the command too
        row.declare(*options, given);
        options->callback([&chosen, &row] { chosen = &row; });
    }
    app.require_subcommand(0, 1); // none is told below, in words of our own
}

/** The command that the words name, or null when they only asked for help, which is then given. */
const command *parse(CLI::App &app, int count, char **words, const command *const &chosen,
                     results &output)
{
    try {
        app.parse(count, words);
    } catch (const CLI::CallForVersion &) {
        output.write(version_text() + "\n");
        return nullptr;
    } catch (const CLI::CallForHelp &) {
        output.write(app.help());
        return nullptr;
    } catch (const CLI::ParseError &problem) {
        throw failure(exit_code::usage, problem.what(), see_help);
    }
    if (chosen == nullptr)
        throw failure(exit_code::usage, "no command was given", see_help);
    return chosen;
}

const std::string &library_default_service()
{
    static const std::string base = urls[1];
    return base;
}

std::optional<session> session_if_readable(const session_file &sessions)
{
    try {
        return sessions.load();
    } catch (const failure &problem) {
        warn(problem.why);
        return std::nullopt;
    }
}

/** A command's surroundings, made step by step as the command asks for them: signing out must work
 * when the service's address does not. */
class runtime {
public:
    runtime(const arguments &given, const environment &surroundings, results &output)
        : given_(given), surroundings_(surroundings), output_(output),
          profile_(load_profile(configuration_path(surroundings), profile_name())),
          sessions_(choose_session_file(given.common, surroundings, profile_)),
          log_(given.common.verbose, given.common.log_file.value_or("")), world_(real_world())
    {
        world_.announce = [](const exchange &, pause_length pause) {
            note("no usable answer; trying again in " + std::to_string(pause.count()) + " ms");
        };
    }

    void run(const command &chosen)
    {
        command_context context = {given_,
                                   surroundings_,
                                   profile_,
                                   sessions_,
                                   [this]() -> const settings & { return decided(); },
                                   [this]() -> service & { return started(); },
                                   output_};
        chosen.run(context);
    }

private:
    std::optional<std::string> profile_name() const
    {
        return given_.common.profile ? given_.common.profile
                                     : surroundings_.value("QUILLMERE_PROFILE");
    }

    const settings &decided()
    {
        if (!settings_)
            settings_ = decide_settings(given_.common,
                                        {surroundings_, profile_, session_if_readable(sessions_),
                                         library_default_service()});
        return *settings_;
    }

    service &started()
    {
        if (!service_ && given_.common.insecure)
            warn("the service's certificate is not verified: anybody on the way can read along");
        if (!service_)
            service_.emplace(decided(), log_, world_);
        return *service_;
    }

    const arguments &given_;
    const environment &surroundings_;
    results &output_;
    profile profile_;
    session_file sessions_;
    diagnostic_log log_;
    retry_world world_;
    std::optional<settings> settings_;
    std::optional<service> service_;
};

// Of what a shell asks while a person waits for the next letter.
void be_quick(common_arguments &given)
{
    given.retries = 0;
    if (!given.timeout)
        given.timeout = 3;
}

void parse_and_run(int count, char **words, const environment &surroundings, results &output)
{
    CLI::App app("The command line of the cloud file storage service.", "quillmere");
    arguments given;
    const command *chosen = nullptr;
    declare_program(app, given, chosen);

    const command *const asked = parse(app, count, words, chosen, output);
    if (asked == nullptr)
        return;
    if (asked->is_hidden())
        be_quick(given.common);
    runtime(given, surroundings, output).run(*asked);
}

// Asked of the words themselves, because a usage error must be told in JSON as well.
result_format format_in(int count, char **words)
{
    for (int i = 1; i < count; ++i)
        if (std::strcmp(words[i], "--json") == 0)
            return result_format::json;
    return result_format::text;
}

void choose_colors(int count, char **words, const environment &surroundings, results &output)
{
    const color_choice choice = color_choice_in(count, words);
    // Whoever reads JSON reads what is beside it with a program, too.
    const bool readable = output.format() == result_format::text;
    output.set_colors(readable && wants_color(choice, surroundings, output.is_terminal()));
    color_messages(readable && wants_color(choice, surroundings, ::isatty(STDERR_FILENO) == 1));
}

int report(const failure &problem, results &output)
{
    try {
        if (output.format() == result_format::json)
            output.write(json_of(problem));
        else
            complain(problem);
    } catch (const failure &unwritable) {
        complain(unwritable);
    }
    return static_cast<int>(problem.code);
}

} // namespace

void declare_program(CLI::App &app, arguments &given, const command *&chosen)
{
    app.set_version_flag("--version", version_text());
    app.option_defaults()->take_last();
    declare_service_options(app, given.common);
    declare_conduct_options(app, given.common);
    declare_commands(app, given, chosen);
}

int run_command_line(int count, char **words, const environment &surroundings, results &output)
{
    try {
        output.set_format(format_in(count, words));
        choose_colors(count, words, surroundings, output);
        parse_and_run(count, words, surroundings, output);
        return static_cast<int>(exit_code::done);
    } catch (const failure &problem) {
        return report(problem, output);
    } catch (const told_failure &problem) {
        return static_cast<int>(problem.code);
    } catch (const std::exception &problem) {
        return report(failure(exit_code::other, problem.what()), output);
    }
}

} // namespace quillmere::tools
