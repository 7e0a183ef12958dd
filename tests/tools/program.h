// Runs the command line as its users do, each time with a home of its own and nothing of the
// tester's environment that could change what it does.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "support/process.h"
#include "support/temporary_folder.h"

namespace quillmere_test {

class program_home {
public:
    using variables = std::map<std::string, std::optional<std::string>>;

    program_home();

    /** The environment of every run; a test may add to it. */
    variables environment;

    command with(std::vector<std::string> arguments, std::string input = {}) const;
    outcome run(std::vector<std::string> arguments, std::string input = {}) const;

    std::string session_path() const { return folder_.path_of("state/quillmere/session.json"); }

    /** Writes a session as signing in would. */
    void sign_in(const std::string &service, const std::string &token) const;

    void configure(const std::string &text) const;

    const temporary_folder &folder() const { return folder_; }

private:
    temporary_folder folder_;
};

} // namespace quillmere_test
