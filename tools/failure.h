// Why a command did not do what was asked: what failed, why, and what to try, with the exit code
// that tells a script which kind of failure it was. Commands throw it; the command line prints it.
#pragma once

#include <cstdint>
#include <exception>
#include <functional>
#include <optional>
#include <string>

namespace quillmere::tools {

/** How the program ends. The numbers are a promise to scripts; docs/command-line.md lists them. */
enum class exit_code : int {
    done = 0,
    other = 1,
    usage = 2,
    refused = 3,
    not_signed_in = 4,
    network = 5,
    bad_http_answer = 6,
    unreadable_answer = 7,
    partly_done = 8,
    local_file = 9,
    interrupted = 130
};

/** The word by which JSON names an exit code. */
const char *kind_of(exit_code code);

struct failure : std::exception {
    failure(exit_code code_given, std::string why_given, std::string advice_given = {})
        : code(code_given), why(std::move(why_given)), advice(std::move(advice_given))
    {
    }
    const char *what() const noexcept override { return why.c_str(); }

    exit_code code;
    std::string why;                    ///< one sentence without a full stop
    std::string advice;                 ///< what to try, or empty
    std::optional<std::int32_t> status; ///< of the operation, when there was one
};

/** Thrown by a command that has told by itself what failed: nothing more is printed. */
struct told_failure {
    exit_code code;
};

/** A failure of a call on a local file, told with the reason that errno gives, and without other
 * advice with what helps against that. */
failure file_failure(const std::string &what, int error_number, std::string advice = {});

/**
 * Takes a step that follows others. When it fails, the failure tells what is done already, and is
 * one of a job that is partly done.
 *
 * @param done what the steps before did ("created photos"), or empty when there were none
 */
void after(const std::string &done, const std::function<void()> &step);

/** The whole message on one line: "quillmere: why (advice)". Control characters are escaped. */
std::string line_of(const failure &problem);

/** The same as a JSON document with a line end. */
std::string json_of(const failure &problem);

} // namespace quillmere::tools
