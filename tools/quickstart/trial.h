// The whole at work on this machine: a service is started, an account made, a file sent there,
// fetched and compared, and all of it is put away again. Every step is a command that a person
// could type.
#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "../command.h"
#include "helpers.h"

namespace quillmere::tools {

/** A folder for files that nobody needs afterwards. */
class scratch_folder {
public:
    explicit scratch_folder(const environment &surroundings);
    scratch_folder(const scratch_folder &) = delete;
    scratch_folder &operator=(const scratch_folder &) = delete;
    ~scratch_folder();

    const std::string &path() const { return path_; }

private:
    std::string path_;
};

/** The emulator's program: beside this one, where a build puts it, or in PATH; a failure when it is
 * nowhere. */
std::string find_emulator(const environment &surroundings, const std::string &own_program);

class trial {
public:
    explicit trial(command_context &context);

    /** Goes through all steps, and tells them. Throws failure, and asked_to_end. */
    void run();

private:
    void make_account();
    void start_service();
    void use_service();
    void exchange_file();
    void compare();
    void put_away();

    void say(const std::string &command);
    void print(const std::string &text);
    std::string in_work(const std::string &word) const;
    helper_command command_of(const std::string &program,
                              const std::vector<std::string> &words) const;
    void run(const std::string &name, const std::vector<std::string> &words);
    void tell(std::chrono::milliseconds time);

    results &output_;
    const environment &surroundings_;
    std::string own_program_;
    std::string emulator_program_;
    awaited_signals signals_;
    scratch_folder work_; // goes when the service is gone
    std::unique_ptr<helper> service_;
    std::vector<std::string> said_;
    std::string digest_;
};

} // namespace quillmere::tools
