#include "program.h"

#include <filesystem>

#include "session_file.h"

namespace quillmere_test {

program_home::program_home()
{
    environment = {{"HOME", folder_.path()},
                   {"XDG_STATE_HOME", folder_.path_of("state")},
                   {"XDG_CONFIG_HOME", folder_.path_of("config")},
                   {"TERM", "dumb"}}; // which shows no colours
    for (const char *variable :
         {"QUILLMERE_SERVICE", "QUILLMERE_EMULATOR", "QUILLMERE_PROFILE", "QUILLMERE_APP_ID",
          "QUILLMERE_APP_KEY", "SSL_CERT_FILE", "http_proxy", "https_proxy", "HTTPS_PROXY",
          "all_proxy", "ALL_PROXY", "no_proxy", "NO_PROXY", "NO_COLOR", "QUILLMERE_SESSION_FILE"})
        environment[variable] = std::nullopt;
}

command program_home::with(std::vector<std::string> arguments, std::string input) const
{
    command what;
    what.program = QUILLMERE_PROGRAM;
    what.arguments = std::move(arguments);
    what.environment = environment;
    what.input = std::move(input);
    return what;
}

outcome program_home::run(std::vector<std::string> arguments, std::string input) const
{
    return quillmere_test::run(with(std::move(arguments), std::move(input)));
}

void program_home::sign_in(const std::string &service, const std::string &token) const
{
    quillmere::tools::session_file(session_path()).save({service, "someone@example.org", token});
}

void program_home::configure(const std::string &text) const
{
    std::filesystem::create_directories(folder_.path_of("config/quillmere"));
    folder_.write("config/quillmere/config", text);
}

} // namespace quillmere_test
