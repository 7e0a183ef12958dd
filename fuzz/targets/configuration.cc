// The configuration file of the command line, and what is decided by it: a line that names the
// profile, one with the service in the environment, then the file.
#include <algorithm>
#include <optional>
#include <sstream>

#include <nlohmann/json.hpp>

#include "failure.h"
#include "profile.h"
#include "settings.h"
#include "support/choices.h"
#include "support/target.h"

namespace quillmere_fuzz {
namespace {

using namespace quillmere::tools;

constexpr const char *path = "/the/configuration";
constexpr const char *keys[] = {"app_id", "app_key", "app_key_file", "ca_file",      "email",
                                "proxy",  "retries", "service",      "session_file", "timeout"};

bool shows_no_controls(const std::string &text)
{
    return std::none_of(text.begin(), text.end(), [](char each) {
        return static_cast<unsigned char>(each) < ' ' || each == 0x7f;
    });
}

void check_failure(const failure &why)
{
    expect(why.code == exit_code::local_file || why.code == exit_code::usage, "whose fault it is");
    std::string line = line_of(why);
    expect(!why.why.empty() && line.back() == '\n', "a failure has a line of its own");
    line.pop_back();
    expect(shows_no_controls(line), "a failure is told on one line");
    expect(nlohmann::json::accept(json_of(why)), "a failure is told as JSON");
}

std::optional<profile> read(const std::string &text, const std::optional<std::string> &name)
{
    try {
        return read_profile(text, name, path);
    } catch (const failure &why) {
        expect(why.code == exit_code::local_file, "a bad file is the file's fault");
        check_failure(why);
        return std::nullopt;
    }
}

std::string without_blanks(const std::string &text)
{
    const char *blanks = " \t\r\n";
    size_t first = text.find_first_not_of(blanks);
    if (first == std::string::npos)
        return {};
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

// "profile work" is called "work".
std::string without_the_word(const std::string &heading)
{
    if (heading.substr(0, 8) != "profile " && heading.substr(0, 8) != "profile\t")
        return heading;
    return without_blanks(heading.substr(8));
}

// The last value of the key in the sections of this name, which the file is known to have.
std::optional<std::string> value_in(const std::string &text, const std::string &section,
                                    const std::string &key)
{
    std::optional<std::string> found;
    std::string current = "default";
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        line = without_blanks(line);
        if (line.empty() || line[0] == '#' || line[0] == ';')
            continue;
        size_t equals = line.find('=');
        if (line[0] == '[' && line.back() == ']')
            current = without_the_word(without_blanks(line.substr(1, line.size() - 2)));
        else if (current == section && without_blanks(line.substr(0, equals)) == key)
            found = without_blanks(line.substr(equals + 1));
    }
    return found && !found->empty() ? found : std::nullopt;
}

void check_profile(const profile &found, const std::string &text, const std::string &section)
{
    for (const char *key : keys)
        expect(found.value(key) == value_in(text, section, key), "what the file says of the key");
}

void check_decision(const settings &decided)
{
    const std::string &base = decided.addresses.secure;
    expect(base.substr(0, 8) == "https://" && base.size() > 8, "the service is asked by https");
    expect(base.back() != '/' && shows_no_controls(base), "an address that paths can follow");
    expect(normal_base_address(base, "again") == base, "a normal address stays as it is");
    expect(!decided.proxy || shows_no_controls(decided.proxy->url), "a proxy that is an address");
    expect(decided.timeout_seconds >= 1 && decided.retries >= 0, "usable numbers");
}

void decide(const profile &chosen, const std::string &service)
{
    environment surroundings([&](const char *name) {
        return std::string_view(name) == "QUILLMERE_SERVICE" ? service.c_str() : nullptr;
    });
    common_arguments given;
    given.insecure = true; // or files of this machine would have their say
    try {
        check_decision(decide_settings(
            given, {surroundings, chosen, std::nullopt, "https://service.example", {}}));
    } catch (const failure &why) {
        check_failure(why);
    }
}

void try_configuration(std::string_view input)
{
    choices chosen(input);
    std::string name = chosen.line();
    std::string service = chosen.line();
    std::string text(chosen.rest());
    std::optional<std::string> wanted;
    if (!name.empty())
        wanted = name;

    std::optional<profile> found;
    within_budget(linear, input.size(), [&] { found = read(text, wanted); });
    if (!found)
        return;
    check_profile(*found, text, wanted.value_or("default"));
    decide(*found, service);
}

const known_target configuration("configuration", try_configuration);

} // namespace
} // namespace quillmere_fuzz
