// Signing in and out.

#include "commands.h"

#include <cstdlib>
#include <new>

#include <CLI/CLI.hpp>

#include "../failure.h"
#include "../heap.h"
#include "../private_file.h"
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

std::string choose_application_id(command_context &context, const login_arguments &given)
{
    if (const auto &flag = given.app_id)
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

secret_text choose_application_key(command_context &context, const login_arguments &given,
                                   const std::string &id)
{
    const std::string name = "application key";
    if (const auto &flag = given.app_key_file)
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

std::string choose_email(command_context &context, const login_arguments &given)
{
    if (const auto &flag = given.email)
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

credentials choose_credentials(command_context &context, const login_arguments &given)
{
    credentials chosen;
    if (given.facebook_token_file) {
        chosen.facebook_token = read_secret_file(*given.facebook_token_file, "Facebook token");
        return chosen;
    }
    chosen.email = choose_email(context, given);
    chosen.password = choose_password(given);
    return chosen;
}

// The last argument of these operations receives the token or the error message, so that the token
// has to be taken out of the place of the message.
std::string token_from(service &remote, const std::string &action, const operation &asked)
{
    std::string token;
    remote.once(action, [&](char **token_or_error) {
        const std::int32_t status = asked(token_or_error);
        if (status == QM_OK)
            token = *token_or_error;
        return status;
    });
    return token;
}

std::string ask_for_token(service &remote, const application &app, const credentials &chosen)
{
    return token_from(remote, "signing in", [&](char **token_or_error) {
        return get_session_token(chosen.email.c_str(), chosen.password.c_str(),
                                 chosen.facebook_token.c_str(), app.id.c_str(), app.key.c_str(),
                                 token_or_error);
    });
}

std::string ask_for_login_token(service &remote, const application &app, const credentials &chosen)
{
    return token_from(remote, "getting a login token", [&](char **token_or_error) {
        // The library frees the place for the second result itself when the reply is malformed.
        auto *const pkey = static_cast<char **>(std::calloc(1, sizeof(char *)));
        if (pkey == nullptr)
            throw std::bad_alloc();
        const std::int32_t status =
            get_login_token(chosen.email.c_str(), chosen.password.c_str(), app.id.c_str(),
                            app.key.c_str(), pkey, token_or_error);
        if (status != QM_MALFORMED_REPLY) {
            api_free(*pkey);
            api_free(pkey);
        }
        return status;
    });
}

application choose_application(command_context &context, const login_arguments &given)
{
    application app;
    app.id = choose_application_id(context, given);
    app.key = choose_application_key(context, given, app.id);
    return app;
}

struct password_options {
    CLI::Option *from_stdin;
    CLI::Option *from_file;
};

password_options declare_credentials(CLI::App &options, login_arguments &login)
{
    options.add_option("EMAIL", login.email, "E-mail address of the account; asked for if absent")
        ->option_text(" ");
    auto *const from_stdin = options.add_flag("--password-stdin", login.password_from_stdin,
                                              "Read the password from standard input");
    from_stdin->option_text(" ");
    auto *const from_file =
        options.add_option("--password-file", login.password_file, "Read the password from a file")
            ->option_text("FILE")
            ->excludes(from_stdin);
    options.add_option("--app-id", login.app_id, "Id of the application")->option_text("ID");
    options
        .add_option("--app-key-file", login.app_key_file,
                    "Read the key of the application from a file")
        ->option_text("FILE");
    return {from_stdin, from_file};
}

} // namespace

void declare_login(CLI::App &options, arguments &given)
{
    login_arguments &login = given.login;
    const password_options passwords = declare_credentials(options, login);
    options
        .add_option("--facebook-token-file", login.facebook_token_file,
                    "Sign in with the Facebook access token in a file, without a password")
        ->option_text("FILE")
        ->excludes(passwords.from_stdin)
        ->excludes(passwords.from_file);
}

void declare_login_token(CLI::App &options, arguments &given)
{
    login_token_arguments &login_token = given.login_token;
    declare_credentials(options, login_token.login);
    options
        .add_option("--token-file", login_token.token_file,
                    "New file for the token, which only its owner can read")
        ->required()
        ->option_text("FILE");
}

void run_login(command_context &context)
{
    const login_arguments &given = context.given.login;
    const application app = choose_application(context, given);
    const credentials chosen = choose_credentials(context, given);

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

void run_renew(command_context &context)
{
    session current = require_session(context);
    const std::string former = current.token;
    current.token =
        token_from(context.remote(), "renewing the session", [&](char **token_or_error) {
            return renew_session_token(former.c_str(), token_or_error);
        });
    context.sessions.save(current);
    context.output.sentence("Renewed the session at " + current.service,
                            {{"service", "Service", current.service},
                             {"session_file", "Session file", context.sessions.path()}});
}

// The token goes to a file, since a terminal keeps what it has shown.
void run_login_token(command_context &context)
{
    const login_token_arguments &given = context.given.login_token;
    const application app = choose_application(context, given.login);
    const credentials chosen = choose_credentials(context, given.login);
    const std::string token = ask_for_login_token(context.remote(), app, chosen);
    create_private_file(given.token_file, token + "\n", "the token file");
    context.output.sentence(
        "Wrote the login token to " + given.token_file,
        {{"email", "E-mail", chosen.email}, {"token_file", "Token file", given.token_file}});
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
