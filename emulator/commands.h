// The commands that prepare the store: they may run beside a server.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include "store/accounts.h"

namespace emulator {

struct account_settings {
    std::filesystem::path data;
    std::string email;
    std::string password_file; // "-" is standard input
    std::string facebook_token_file;
    std::vector<std::string> profile; // "name=value" each
    account_limits limits;
};

struct application_settings {
    std::filesystem::path data;
    std::string id;
    std::string key_file;
};

struct content_settings {
    std::filesystem::path data;
    std::string email;
    std::filesystem::path from; // a file or a folder; "-" is standard input
    std::string path;           // where it goes in the account
};

/** Throws std::runtime_error for an account that cannot be made, with the reason. */
void add_account(const account_settings &settings);

/** Registers an application, or gives it another key. */
void add_application(const application_settings &settings);

/** Puts a file, or all that a folder holds, into an account. */
void put_content(const content_settings &settings);

/** Empties the trees of all accounts. */
void reset(const std::filesystem::path &data);

/** Prints what the store holds. */
void print_dump(const std::filesystem::path &data);

} // namespace emulator
