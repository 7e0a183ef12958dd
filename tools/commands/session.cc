// Signing in and out.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../failure.h"
#include "../heap.h"
#include "../secret_input.h"

namespace quillmere::tools {

namespace {

struct application {
    std::string id;
    secret_text key;
};

struct credentials {
    std::string email;
    secret_text password;
    secret_text facebook_token;
};

std::string choose_application_id(command_context &context)
{
    if (const auto &flag = context.given.login.app_id)
        return *flag;
    if (const auto variable = context.surroundings.value("QUILLMERE_APP_ID"))
        return *variable;
    if (const auto configured = context.chosen_profile.value("app_id"))
        return *configured;
    if (context.chosen().emulator)
        return development_application_id;
    throw failure(exit_code::usage, "no application id was given",
                  "use --app-id, QUILLMERE_APP_ID or app_id in the configuration file");
}

secret_text choose_application_key(command_context &context, const std::string &id)
{
    const std::string name = "application key";
    if (const auto &flag = context.given.login.app_key_file)
        return read_secret_file(*flag, name);
    if (const auto variable = context.surroundings.value("QUILLMERE_APP_KEY"))
        return secret_of(*variable, name);
    if (const auto file = context.chosen_profile.value("app_key_file"))
        return read_secret_file(*file, name);
    if (const auto configured = context.chosen_profile.value("app_key"))
        return secret_of(*configured, name);
    if (context.chosen().emulator && id == development_application_id)
        return secret_of(development_application_key, name);
    throw failure(
        exit_code::usage, "no application key was given",
        "use --app-key-file, QUILLMERE_APP_KEY or app_key_file in the configuration file");
}

std::string choose_email(command_context &context)
{
    if (const auto &flag = context.given.login.email)
        return *flag;
    if (const auto configured = context.chosen_profile.value("email"))
        return *configured;
    return prompt_for_text("E-mail", "give the e-mail address as an argument");
}

secret_text choose_password(const login_arguments &given)
{
    if (given.password_from_stdin)
        return read_secret(STDIN_FILENO, "password");
    if (given.password_file)
        return read_secret_file(*given.password_file, "password");
    return prompt_for_secret("Password", "use --password-stdin or --password-file");
}

credentials choose_credentials(command_context &context)
{
    const login_arguments &given = context.given.login;
    credentials chosen;
    if (given.facebook_token_file) {
        chosen.facebook_token = read_secret_file(*given.facebook_token_file, "Facebook token");
        return chosen;
    }
    chosen.email = choose_email(context);
    chosen.password = choose_password(given);
    return chosen;
}

// The last argument of the library's operation receives the token or the error message, so that the
// token has to be taken out of the place of the message.
std::string ask_for_token(service &remote, const application &app, const credentials &chosen)
{
    std::string token;
    remote.once("signing in", [&](char **token_or_error) {
        const std::int32_t status = get_session_token(chosen.email.c_str(), chosen.password.c_str(),
                                                      chosen.facebook_token.c_str(), app.id.c_str(),
                                                      app.key.c_str(), token_or_error);
        if (status == QM_OK)
            token = *token_or_error;
        return status;
    });
    return token;
}

} // namespace

void declare_login(CLI::App &options, arguments &given)
{
    login_arguments &login = given.login;
    options.add_option("EMAIL", login.email, "E-mail address of the account; asked for if absent")
        ->option_text(" ");
    auto *const from_stdin = options.add_flag("--password-stdin", login.password_from_stdin,
                                              "Read the password from standard input");
    auto *const from_file =
        options.add_option("--password-file", login.password_file, "Read the password from a file")
            ->option_text("FILE")
            ->excludes(from_stdin);
    options
        .add_option("--facebook-token-file", login.facebook_token_file,
                    "Sign in with the Facebook access token in a file, without a password")
        ->option_text("FILE")
        ->excludes(from_stdin)
        ->excludes(from_file);
    from_stdin->option_text(" ");
    options.add_option("--app-id", login.app_id, "Id of the application")->option_text("ID");
    options
        .add_option("--app-key-file", login.app_key_file,
                    "Read the key of the application from a file")
        ->option_text("FILE");
}

void run_login(command_context &context)
{
    application app;
    app.id = choose_application_id(context);
    app.key = choose_application_key(context, app.id);
    const credentials chosen = choose_credentials(context);

    service &remote = context.remote();
    session current = {remote.base(), chosen.email, ask_for_token(remote, app, chosen)};
    context.sessions.save(current);

    const std::string who = current.email.empty() ? "" : " as " + current.email;
    context.output.sentence("Signed in to " + current.service + who,
                            {{"service", "Service", current.service},
                             {"email", "E-mail", current.email},
                             {"session_file", "Session file", context.sessions.path()}});
}

void run_logout(command_context &context)
{
    const bool signed_out = context.sessions.remove();
    context.output.sentence(signed_out ? "Signed out" : "Nobody was signed in",
                            {{"signed_out", "Signed out", signed_out}});
}

session require_session(command_context &context)
{
    const auto current = context.sessions.load();
    if (!current)
        throw failure(exit_code::not_signed_in, "nobody is signed in",
                      "sign in with: quillmere login");
    // A token is for the service that gave it; sending it elsewhere would give the session away.
    const std::string &asked = context.chosen().addresses.secure;
    if (current->service != asked)
        throw failure(exit_code::not_signed_in,
                      "the session is one of " + current->service + ", not of " + asked,
                      "sign in there with: quillmere login");
    return *current;
}

} // namespace quillmere::tools
