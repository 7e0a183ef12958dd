#include "examples/examples_fixture.h"

#include <nlohmann/json.hpp>

namespace quillmere_test {

namespace {

constexpr const char *desktop_upload_path = "/api/upload/upload.php?type=desktop";

nlohmann::json stored_root(const emulated_service &service)
{
    return nlohmann::json::parse(service.command_output({"--dump"}))
        .at("accounts")
        .at(0)
        .at("root");
}

} // namespace

variables example_environment(const std::string &service, const std::string &uploads,
                              const std::string &root_path)
{
    return {{"QUILLMERE_SERVICE", service},
            {"QUILLMERE_UPLOADS", uploads + desktop_upload_path},
            {"QUILLMERE_CA_FILE", root_path},
            {"QUILLMERE_EMAIL", account_email},
            {"QUILLMERE_PASSWORD", emulated_password}};
}

outcome run_example(const std::string &name, std::vector<std::string> arguments,
                    variables environment)
{
    command what;
    what.program = std::string(QUILLMERE_EXAMPLES) + "/" + name;
    what.arguments = std::move(arguments);
    what.environment = std::move(environment);
    return quillmere_test::run(what);
}

Examples::Examples() { service.add_account(account_email); }

outcome ExamplesOnScriptedService::run(const std::string &name,
                                       std::vector<std::string> arguments) const
{
    return run_example(name, std::move(arguments),
                       example_environment(server.base_url(), server.base_url(), test_root_path()));
}

outcome Examples::run(const std::string &name, std::vector<std::string> arguments,
                      const variables &changes) const
{
    variables environment =
        example_environment(service.https_url(), service.http_url(), service.root_path());
    for (const auto &[variable, value] : changes)
        environment[variable] = value;
    return run_example(name, std::move(arguments), std::move(environment));
}

std::string Examples::put(const std::string &path, const std::string &bytes) const
{
    service.command_output(
        {"put-content", "--account", account_email, "--path", path, "--from", "-"}, bytes);
    return stored_files()[path.substr(1)].key;
}

std::map<std::string, stored_file> Examples::stored_files() const
{
    std::map<std::string, stored_file> files;
    const nlohmann::json root = stored_root(service);
    for (const auto &each : root.at("files"))
        files[each.at("name")] = {each.at("key"), each.at("size").dump(),
                                  each.at("revision").dump()};
    return files;
}

std::vector<std::string> Examples::stored_folders() const
{
    std::vector<std::string> keys;
    const nlohmann::json root = stored_root(service);
    for (const auto &each : root.at("folders"))
        keys.push_back(each.at("key"));
    return keys;
}

} // namespace quillmere_test
