#include "commands.h"

#include <ctime>
#include <iostream>
#include <stdexcept>

#include <unistd.h>

#include "data_directory.h"
#include "store/accounts.h"
#include "store/applications.h"
#include "store/database.h"
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

} // namespace

void add_account(const account_settings &settings)
{
    check_text(settings.email, "e-mail address");
    const std::string password = read_secret(settings.password_file, "password");
    std::string facebook_token;
    if (!settings.facebook_token_file.empty())
        facebook_token = read_secret(settings.facebook_token_file, "Facebook access token");

    database store(data_directory(settings.data).store());
    if (!add_account(store, {settings.email, password, facebook_token}, std::time(nullptr)))
        throw std::runtime_error("the e-mail address or the Facebook access token is taken: " +
                                 settings.email);
    std::cout << "account: " << settings.email << std::endl;
}

void add_application(const application_settings &settings)
{
    check_text(settings.id, "application id");
    const std::string key = read_secret(settings.key_file, "application key");
    database store(data_directory(settings.data).store());
    put_application(store, {settings.id, key});
    std::cout << "application: " << settings.id << std::endl;
}

} // namespace emulator
