// Secrets that a test makes up, to look for them where none may be.
#pragma once

#include <map>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include <sys/types.h>

namespace quillmere_test {

class canaries {
public:
    /** The names of those that were found. */
    using names = std::set<std::string>;

    /** Sought from now on as it is, and as a query has it. */
    void add(const std::string &name, const std::string &text);

    names in(std::string_view bytes) const;

    /** The files that hold any, by their paths below the folder. */
    std::map<std::string, names> in_files_of(const std::string &folder) const;

    /** In the arguments of any process of this machine, and the environment of one. */
    names in_arguments() const;
    names in_environment_of(pid_t process) const;

private:
    struct form {
        std::string name;
        std::string bytes;
    };

    std::vector<form> forms_;
};

/** The processes that a process has started, as long as they are there. */
std::vector<pid_t> children_of(pid_t process);

/** The signature of a login: over the credentials, the application's id and its key. */
std::string login_signature(const std::string &credentials, const std::string &application_id,
                            const std::string &application_key);

} // namespace quillmere_test
