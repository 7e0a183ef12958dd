#include "emulator_account.h"

namespace quillmere_test {

using json = nlohmann::json;

emulator_account::emulator_account()
{
    add_account(account_email, "a-token-of-facebook");
    start();
}

void emulator_account::add_account(const std::string &email,
                                   const std::string &facebook_token) const
{
    std::vector<std::string> arguments = {"add-account", "--email", email, "--password-file", "-"};
    if (!facebook_token.empty())
        arguments.insert(arguments.end(),
                         {"--facebook-token-file",
                          home.folder().write("facebook-token", facebook_token + "\n")});
    emulator_command(arguments, std::string(account_password) + "\n");
}

outcome emulator_account::emulator_command(std::vector<std::string> arguments,
                                           std::string input) const
{
    command what;
    what.program = QUILLMERE_EMULATOR;
    what.arguments = std::move(arguments);
    what.arguments.insert(what.arguments.end(), {"--data", data});
    what.input = std::move(input);
    outcome ended = run(what);
    EXPECT_EQ(ended.exit_status, 0) << testing::PrintToString(what.arguments) << ended.err;
    return ended;
}

void emulator_account::start()
{
    command what;
    what.program = QUILLMERE_EMULATOR;
    what.arguments = {"--data",     data, "--port",  "0",           "--http-port",  "0",
                      "--ready-fd", "3",  "--admin", "127.0.0.1:0", "--ready-file", ready_file};
    emulator = std::make_unique<process>(what);
    const std::string line = emulator->wait_for_line(channel::report, "https_url");
    base = json::parse(line).at("https_url");
    admin_url = json::parse(line).at("admin_url");
    home.environment["QUILLMERE_EMULATOR"] = ready_file;
}

void emulator_account::put_content(const std::string &path, const std::string &bytes) const
{
    emulator_command({"put-content", "--account", account_email, "--path", path, "--from", "-"},
                     bytes);
}

json emulator_account::dump() const { return json::parse(emulator_command({"--dump"}).out); }

json emulator_account::dump_of(const std::string &email) const
{
    const json all = dump();
    for (const json &account : all.at("accounts"))
        if (account.at("email") == email)
            return account;
    ADD_FAILURE() << "there is no account " << email;
    return {};
}

outcome emulator_account::sign_in(std::vector<std::string> more) const
{
    more.insert(more.begin(), {"login", account_email, "--password-stdin"});
    return home.run(more, std::string(account_password) + "\n");
}

json emulator_account::result_of(std::vector<std::string> arguments) const
{
    arguments.emplace_back("--json");
    const outcome ended = home.run(arguments);
    EXPECT_EQ(ended.exit_status, 0) << testing::PrintToString(arguments) << ended.out << ended.err;
    return json::parse(ended.out, nullptr, false);
}

std::vector<std::string> emulator_account::listed_names(const std::string &path) const
{
    const json listing = result_of({"ls", path});
    std::vector<std::string> names;
    for (const json &each : listing.at("entries"))
        names.push_back(each.at("name"));
    return names;
}

json emulator_account::error_of(std::vector<std::string> arguments, int exit_code) const
{
    arguments.emplace_back("--json");
    const outcome ended = home.run(arguments);
    EXPECT_EQ(ended.exit_status, exit_code)
        << testing::PrintToString(arguments) << ended.out << ended.err;
    EXPECT_EQ(ended.err, "") << testing::PrintToString(arguments);
    json error = json::parse(ended.out, nullptr, false).value("error", json::object());
    EXPECT_EQ(error.value("exit_code", -1), exit_code) << testing::PrintToString(arguments);
    return error;
}

} // namespace quillmere_test
