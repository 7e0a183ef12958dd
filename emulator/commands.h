// The commands that prepare the store: they may run beside a server.
#pragma once

#include <filesystem>
#include <string>

namespace emulator {

struct account_settings {
    std::filesystem::path data;
    std::string email;
    std::string password_file; // "-" is standard input
    std::string facebook_token_file;
};

struct application_settings {
    std::filesystem::path data;
    std::string id;
    std::string key_file;
};

/** Throws std::runtime_error for an account that cannot be made, with the reason. */
void add_account(const account_settings &settings);

/** Registers an application, or gives it another key. */
void add_application(const application_settings &settings);

} // namespace emulator
