#include "command_line.h"

#include <iostream>
#include <limits>

#include <CLI/CLI.hpp>

#include "commands.h"
#include "data_directory.h"
#include "loopback_address.h"
#include "serve.h"

namespace emulator {
namespace {

enum exit_code { done = 0, failed = 1, wrong_usage = 2 };

// A year; beyond that a session is as good as endless, and sums stay far from overflow.
constexpr std::int64_t longest_session = 366 * 24 * 60 * 60;

struct arguments {
    std::string data;
    serve_settings serving;
    std::string ready_file;
    account_settings account;
    application_settings application;
    content_settings content; // of put-content
    content_settings preload; // of serving
    bool dumps = false;
};

/** The commands that were defined, to see which was given. */
struct command_set {
    CLI::App *account;
    CLI::App *application;
    CLI::App *content;
    CLI::App *reset;
};

void define_data(CLI::App &app, arguments &into)
{
    app.add_option("--data", into.data,
                   "Folder of the store and the certificates (under the XDG state folder)")
        ->type_name("DIR");
}

void define_serving(CLI::App &app, arguments &into)
{
    const CLI::Range ports(0, 65535);
    app.set_version_flag("--version", "quillmere-emulator " QUILLMERE_EMULATOR_VERSION);
    app.add_option("--port", into.serving.https_port, "Port of HTTPS, 0 to let the kernel pick")
        ->check(ports)
        ->type_name("N");
    app.add_option("--http-port", into.serving.http_port, "Port of HTTP, 0 to let the kernel pick")
        ->check(ports)
        ->type_name("N");
    app.add_option("--ready-file", into.ready_file, "File to write, as JSON, when it listens")
        ->type_name("FILE");
    app.add_option("--ready-fd", into.serving.ready_descriptor,
                   "Open descriptor to write the same to")
        ->check(CLI::Range(0, std::numeric_limits<int>::max()))
        ->type_name("N");
    app.add_option_function<std::string>(
           "--admin",
           [&into](const std::string &text) {
               into.serving.admin = parse_loopback_address(text);
               if (!into.serving.admin)
                   throw CLI::ValidationError(
                       "--admin", text + " is no loopback address such as 127.0.0.1:0 or [::1]:0");
           },
           "Address for faults, counts and resets; port 0 lets the kernel pick")
        ->type_name("ADDRESS:PORT");
    app.add_option("--session-lifetime", into.serving.session_lifetime,
                   "Seconds until an unused session expires (600)")
        ->check(CLI::Range(std::int64_t{1}, longest_session))
        ->type_name("N");
}

void define_state(CLI::App &app, arguments &into)
{
    auto *preload =
        app.add_option("--preload", into.preload.from, "Folder to load before it serves")
            ->type_name("DIR");
    auto *account =
        app.add_option("--account", into.preload.email, "E-mail address of whom it is loaded into")
            ->type_name("ADDRESS");
    preload->needs(account);
    account->needs(preload);
    app.add_flag("--dump", into.dumps, "Print accounts, trees and revisions as JSON, and end");
}

void define_limits(CLI::App &command, account_settings &into)
{
    const CLI::Range sizes(std::int64_t{0}, std::int64_t{1} << 50);
    command.add_option("--base-storage", into.limits.base_storage, "Bytes of storage")
        ->check(sizes)
        ->type_name("N");
    command.add_option("--bonus-storage", into.limits.bonus_storage, "Bytes of it beside those")
        ->check(sizes)
        ->type_name("N");
    command.add_option("--bandwidth-limit", into.limits.bandwidth, "Bytes that it may serve")
        ->check(sizes)
        ->type_name("N");
}

CLI::App *define_account(CLI::App &app, arguments &into)
{
    CLI::App *command = app.add_subcommand("add-account", "Make an account");
    define_data(*command, into);
    command->add_option("--email", into.account.email, "Its e-mail address")->required();
    command
        ->add_option("--password-file", into.account.password_file,
                     "File with its password, - for standard input")
        ->required()
        ->type_name("FILE");
    command
        ->add_option("--facebook-token-file", into.account.facebook_token_file,
                     "File with the Facebook access token that also signs in to it")
        ->type_name("FILE");
    command
        ->add_option("--profile", into.account.profile, "A field of its profile; may be repeated")
        ->allow_extra_args(false)
        ->type_name("NAME=VALUE");
    define_limits(*command, into.account);
    return command;
}

CLI::App *define_application(CLI::App &app, arguments &into)
{
    CLI::App *command =
        app.add_subcommand("add-application", "Register an application, or change its key");
    define_data(*command, into);
    command->add_option("--id", into.application.id, "Its id")->required();
    command
        ->add_option("--key-file", into.application.key_file,
                     "File with its key, - for standard input")
        ->required()
        ->type_name("FILE");
    return command;
}

CLI::App *define_content(CLI::App &app, arguments &into)
{
    CLI::App *command =
        app.add_subcommand("put-content", "Put a file, or what a folder holds, into an account");
    define_data(*command, into);
    command->add_option("--account", into.content.email, "The account's e-mail address")
        ->required()
        ->type_name("ADDRESS");
    command->add_option("--path", into.content.path, "Where it goes, such as /photos/a.jpg")
        ->required()
        ->type_name("PATH");
    command->add_option("--from", into.content.from, "The file or folder, - for standard input")
        ->required()
        ->type_name("FILE");
    return command;
}

CLI::App *define_reset(CLI::App &app, arguments &into)
{
    CLI::App *command = app.add_subcommand("reset", "Empty the trees of all accounts");
    define_data(*command, into);
    return command;
}

void start_serving(const arguments &given)
{
    if (!given.preload.from.empty())
        put_content(given.preload);
    serve(given.serving);
}

void run_command(const command_set &commands, arguments &given)
{
    const std::filesystem::path data =
        given.data.empty() ? default_data_directory() : std::filesystem::path(given.data);
    given.account.data = given.application.data = given.serving.data = data;
    given.content.data = given.preload.data = data;
    given.preload.path = "/";
    given.serving.ready_file = given.ready_file;
    if (commands.account->parsed())
        add_account(given.account);
    else if (commands.application->parsed())
        add_application(given.application);
    else if (commands.content->parsed())
        put_content(given.content);
    else if (commands.reset->parsed())
        reset(data);
    else if (given.dumps)
        print_dump(data);
    else
        start_serving(given);
}

} // namespace

int run_command_line(int argc, char **argv)
{
    CLI::App app("A local service of the quillmere web API, on the loopback interface.\n"
                 "Without a command it serves until SIGINT or SIGTERM.",
                 "quillmere-emulator");
    arguments given;
    define_data(app, given);
    define_serving(app, given);
    define_state(app, given);
    const command_set commands{define_account(app, given), define_application(app, given),
                               define_content(app, given), define_reset(app, given)};
    app.require_subcommand(0, 1);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &problem) {
        return app.exit(problem) == 0 ? done : wrong_usage;
    }
    try {
        run_command(commands, given);
        return done;
    } catch (const std::exception &problem) {
        std::cerr << "quillmere-emulator: " << problem.what() << std::endl;
        return failed;
    }
}

} // namespace emulator
