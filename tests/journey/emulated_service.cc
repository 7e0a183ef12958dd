#include "journey/emulated_service.h"

#include <stdexcept>

#include <nlohmann/json.hpp>

namespace quillmere_test {
namespace {

constexpr const char *upload_path = "/api/upload/upload.php?type=desktop";

command emulator_command(std::vector<std::string> arguments)
{
    command what;
    what.program = QUILLMERE_EMULATOR;
    what.arguments = std::move(arguments);
    return what;
}

std::unique_ptr<std::FILE, int (*)(std::FILE *)> unread_log()
{
    std::FILE *stream = std::fopen("/dev/null", "w");
    set_output_file(stream);
    return {stream, std::fclose};
}

} // namespace

std::string taken(char *text)
{
    const owned_text owned(text);
    return text ? text : "";
}

emulated_service::emulated_service() { start(); }

void emulated_service::start()
{
    emulator_ = std::make_unique<process>(emulator_command(
        {"--data", folder_.path_of("data"), "--port", "0", "--http-port", "0", "--ready-fd", "3"}));
    const auto told = nlohmann::json::parse(emulator_->wait_for_line(channel::report, "https_url"));
    https_url_ = told.at("https_url");
    http_url_ = told.at("http_url");
    root_path_ = told.at("ca_file");
}

void emulated_service::add_account(const std::string &email) const
{
    command_output({"add-account", "--email", email, "--password-file", "-"},
                   std::string(emulated_password) + "\n");
}

std::string emulated_service::command_output(std::vector<std::string> arguments,
                                             const std::string &input) const
{
    arguments.insert(arguments.end(), {"--data", folder_.path_of("data")});
    command what = emulator_command(std::move(arguments));
    what.input = input;
    const outcome ended = run(what);
    if (ended.exit_status != 0)
        throw std::runtime_error(ended.err);
    return ended.out;
}

library_on_service::library_on_service(const emulated_service &service, reached_over way)
    : bases_{service.http_url(),
             way == reached_over::tls ? service.https_url() : service.http_url(),
             service.http_url() + upload_path, service.https_url() + upload_path},
      log_(unread_log()), library_(service.root_path().c_str())
{
    for (int index = 0; index < 4; ++index)
        urls[index] = bases_[index].c_str();
}

std::string library_on_service::session_of(const std::string &email) const
{
    char *token = nullptr;
    const int32_t status = get_session_token(email.c_str(), emulated_password, nullptr, "42",
                                             "quillmere-development-key", &token);
    const std::string text = taken(token);
    if (status != QM_OK)
        throw std::runtime_error("no session: " + text);
    return text;
}

} // namespace quillmere_test
