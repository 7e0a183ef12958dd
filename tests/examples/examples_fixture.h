// Runs the examples as their head comments say, against an emulator with one account.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "journey/emulated_service.h"

namespace quillmere_test {

inline constexpr const char *account_email = "ann@example.org";

using variables = std::map<std::string, std::optional<std::string>>;

// What the examples read from the environment, led to one service.
variables example_environment(const std::string &service, const std::string &uploads,
                              const std::string &root_path);

outcome run_example(const std::string &name, std::vector<std::string> arguments,
                    variables environment);

struct stored_file {
    std::string key;
    std::string size;
    std::string revision;
};

class Examples : public testing::Test {
protected:
    Examples();

    outcome run(const std::string &name, std::vector<std::string> arguments = {},
                const variables &changes = {}) const;

    // Puts bytes under a path of the account, past the library. Returns the file's key.
    std::string put(const std::string &path, const std::string &bytes) const;

    // Files in the account's root, by name.
    std::map<std::string, stored_file> stored_files() const;

    // Keys of the folders in the account's root, in the order in which they were made.
    std::vector<std::string> stored_folders() const;

    emulated_service service;
    temporary_folder folder;

private:
    proxyless_environment environment_;
};

// For what the emulator never answers. The script says what the service does.
class ExamplesOnScriptedService : public testing::Test {
protected:
    outcome run(const std::string &name, std::vector<std::string> arguments = {}) const;

    scripted_server server{tls_with(loopback_certificate())};

private:
    proxyless_environment environment_;
};

} // namespace quillmere_test
