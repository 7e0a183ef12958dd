// Puts every exported variable of the library back as it was, the settings behind functions at
// their initial values, and every environment variable that a test changes.
#pragma once

#include <cstdint>
#include <cstdio>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "quillmere.h"

namespace quillmere_test {

using optional_text = std::optional<std::string>;

// A new value for texts that the library owns: malloc memory, or NULL.
void replace_owned_text(char *&owned, const optional_text &text);

class globals_guard {
public:
    globals_guard();
    ~globals_guard();
    globals_guard(const globals_guard &) = delete;
    globals_guard &operator=(const globals_guard &) = delete;

private:
    struct saved_proxy {
        int32_t enabled;
        optional_text host;
        optional_text user;
        optional_text password;
        int64_t port;
    };

    void restore_proxy() const;

    const char *urls_[4];
    const char *api_version_;
    api_error_hook check_api_error_;
    int32_t ssl_disabled_;
    void *debug_replace_;
    std::FILE *output_file_;
    saved_proxy proxy_;
    optional_text ca_path_;
    int64_t default_timeout_;
    int32_t connection_attempts_;
    std::vector<const char *> uris_;
};

// Changes to the environment, taken back in the end. For one thread, as setenv() is.
class environment_guard {
public:
    environment_guard() = default;
    ~environment_guard();
    environment_guard(const environment_guard &) = delete;
    environment_guard &operator=(const environment_guard &) = delete;

    void set(const std::string &name, const std::string &value);
    void unset(const std::string &name);

private:
    void save(const std::string &name);

    std::map<std::string, optional_text> before_;
};

} // namespace quillmere_test
