// What a command line said, before anything is made of it.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace quillmere::tools {

/** The options that every command has. */
struct common_arguments {
    std::optional<std::string> service;
    std::optional<std::string> emulator;
    std::optional<std::string> profile;
    std::optional<std::string> ca_file;
    std::optional<std::string> log_file;
    std::optional<int> timeout;
    std::optional<int> retries;
    bool insecure = false;
    bool plain_http = false;
    bool json = false;
    bool verbose = false;
};

struct login_arguments {
    std::optional<std::string> email;
    std::optional<std::string> password_file;
    std::optional<std::string> facebook_token_file;
    std::optional<std::string> app_id;
    std::optional<std::string> app_key_file;
    bool password_from_stdin = false;
};

struct device_status_arguments {
    std::uint32_t device_id = 0;
};

struct arguments {
    common_arguments common;
    login_arguments login;
    device_status_arguments device_status;
};

} // namespace quillmere::tools
