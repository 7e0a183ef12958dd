#include "command_line.h"

#include <iostream>
#include <limits>

#include <CLI/CLI.hpp>

#include "commands.h"
#include "data_directory.h"
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
    app.add_option("--session-lifetime", into.serving.session_lifetime,
                   "Seconds until an unused session expires (600)")
        ->check(CLI::Range(std::int64_t{1}, longest_session))
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

void run_command(const CLI::App *account, const CLI::App *application, arguments &given)
{
    const std::filesystem::path data =
        given.data.empty() ? default_data_directory() : std::filesystem::path(given.data);
    given.account.data = given.application.data = given.serving.data = data;
    given.serving.ready_file = given.ready_file;
    if (account->parsed())
        add_account(given.account);
    else if (application->parsed())
        add_application(given.application);
    else
        serve(given.serving);
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
    const CLI::App *account = define_account(app, given);
    const CLI::App *application = define_application(app, given);
    app.require_subcommand(0, 1);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &problem) {
        return app.exit(problem) == 0 ? done : wrong_usage;
    }
    try {
        run_command(account, application, given);
        return done;
    } catch (const std::exception &problem) {
        std::cerr << "quillmere-emulator: " << problem.what() << std::endl;
        return failed;
    }
}

} // namespace emulator
