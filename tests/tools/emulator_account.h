// A local service of a test's own, with an account, and a home whose command line talks to it.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "program.h"
#include "support/process.h"

namespace quillmere_test {

constexpr const char *account_email = "someone@example.org";
constexpr const char *account_password = "a pass word & more \xc3\xa4";

class emulator_account : public testing::Test {
protected:
    emulator_account();

    /** Adds an account with the password of them all, and a Facebook token if one is given. */
    void add_account(const std::string &email, const std::string &facebook_token = {}) const;

    /** Runs a command of the emulator on the data of the one that serves. */
    outcome emulator_command(std::vector<std::string> arguments, std::string input = {}) const;

    /** Puts a file with these bytes under a path of the account. */
    void put_content(const std::string &path, const std::string &bytes) const;

    /** What the store holds. */
    nlohmann::json dump() const;

    /** What the store holds of an account. */
    nlohmann::json dump_of(const std::string &email) const;

    outcome sign_in(std::vector<std::string> more = {}) const;

    /** Runs a command that must succeed, and gives its result in JSON. */
    nlohmann::json result_of(std::vector<std::string> arguments) const;

    /** The names that a folder of the account holds, in the order of its listing. */
    std::vector<std::string> listed_names(const std::string &path) const;

    /** Runs a command that must fail with this exit code, and gives the error in JSON. */
    nlohmann::json error_of(std::vector<std::string> arguments, int exit_code) const;

    program_home home;
    const std::string data = home.folder().path_of("emulator");
    const std::string ready_file = home.folder().path_of("ready.json");
    std::unique_ptr<process> emulator;
    std::string base;
    std::string admin_url; // see emulator_admin

private:
    void start();
};

} // namespace quillmere_test
