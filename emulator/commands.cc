#include "commands.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <iostream>
#include <stdexcept>
#include <system_error>
#include <vector>

#include <unistd.h>

#include "data_directory.h"
#include "dump.h"
#include "loading.h"
#include "store/accounts.h"
#include "store/applications.h"
#include "store/content.h"
#include "store/database.h"
#include "store/profiles.h"
#include "store/reset.h"
#include "text.h"

namespace emulator {
namespace {

constexpr std::size_t largest_secret = 4096;

// What no request could carry must not be stored: nobody could ever use it.
void check_text(const std::string &text, const char *what)
{
    if (text.empty())
        throw std::runtime_error(std::string("the ") + what + " is empty");
    if (!is_xml_text(text))
        throw std::runtime_error(std::string("the ") + what +
                                 " is not UTF-8 or holds a control character");
}

// One line end belongs to the file, not to the secret: editors and echo add it.
std::string read_secret(const std::string &file, const char *what)
{
    std::string secret = file == "-" ? read_descriptor(STDIN_FILENO, largest_secret)
                                     : read_file(file, largest_secret);
    if (!secret.empty() && secret.back() == '\n')
        secret.pop_back();
    if (!secret.empty() && secret.back() == '\r')
        secret.pop_back();
    check_text(secret, what);
    return secret;
}

struct profile_value {
    std::string name;
    std::string value;
};

profile_value read_profile_value(const std::string &text)
{
    const std::size_t equals = std::min(text.find('='), text.size());
    const std::string name = text.substr(0, equals);
    if (equals == text.size() || !is_profile_field(name))
        throw std::runtime_error("no NAME=VALUE of a profile: " + text);
    const std::string value = text.substr(equals + 1);
    if (!is_xml_text(value))
        throw std::runtime_error("the profile value is not UTF-8 or holds a control character");
    return {name, value};
}

std::int64_t account_named(database &store, const std::string &email)
{
    const auto account = find_account(store, email);
    if (!account)
        throw std::runtime_error("no such account: " + email);
    return *account;
}

// A dump that a full disk has cut must not pass for one.
void tell(const std::string &text)
{
    if (!(std::cout << text << std::flush))
        throw std::system_error(errno, std::generic_category(), "cannot write to standard output");
}

} // namespace

void add_account(const account_settings &settings)
{
    check_text(settings.email, "e-mail address");
    const std::string password = read_secret(settings.password_file, "password");
    std::string facebook_token;
    if (!settings.facebook_token_file.empty())
        facebook_token = read_secret(settings.facebook_token_file, "Facebook access token");

    std::vector<profile_value> values;
    for (const std::string &each : settings.profile)
        values.push_back(read_profile_value(each));

    database store(data_directory(settings.data).store());
    const auto account =
        add_account(store, {settings.email, password, facebook_token}, std::time(nullptr));
    if (!account)
        throw std::runtime_error("the e-mail address or the Facebook access token is taken: " +
                                 settings.email);
    for (const profile_value &each : values)
        put_profile_field(store, *account, each.name, each.value);
    put_account_limits(store, *account, settings.limits);
    tell("account: " + settings.email + "\n");
}

void add_application(const application_settings &settings)
{
    check_text(settings.id, "application id");
    const std::string key = read_secret(settings.key_file, "application key");
    database store(data_directory(settings.data).store());
    put_application(store, {settings.id, key});
    tell("application: " + settings.id + "\n");
}

void put_content(const content_settings &settings)
{
    const data_directory data(settings.data);
    database store(data.store());
    content_store content(data.content());
    const loading into{store, content, account_named(store, settings.email), std::time(nullptr)};
    if (settings.from == "-")
        load_bytes(into, STDIN_FILENO, settings.path);
    else
        load_tree(into, settings.from, settings.path);
    tell("content: " + settings.path + "\n");
}

void reset(const std::filesystem::path &data_path)
{
    const data_directory data(data_path);
    database store(data.store());
    content_store content(data.content());
    reset_trees(store, content);
    tell("reset: " + data.path().string() + "\n");
}

void print_dump(const std::filesystem::path &data_path)
{
    database store(data_directory(data_path).store());
    tell(dump(store));
}

} // namespace emulator
