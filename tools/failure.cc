#include "failure.h"

#include <cerrno>
#include <system_error>

#include <nlohmann/json.hpp>

#include "text.h"

namespace quillmere::tools {

namespace {

const char *advice_against(int error_number)
{
    switch (error_number) {
    case ENOENT:
    case ENAMETOOLONG:
    case ELOOP:
        return "check the path";
    case EACCES:
    case EPERM:
        return "check who may read and write there";
    case EISDIR:
        return "name a file instead";
    case ENOTDIR:
        return "name a folder on the way that is one";
    case EEXIST:
        return "choose a name that is free";
    case EROFS:
        return "choose a place that can be written";
    case ENOSPC:
    case EDQUOT:
        return "make room, then run it again";
    case EFBIG:
        return "is it the right file?";
    default:
        return "";
    }
}

} // namespace

const char *kind_of(exit_code code)
{
    switch (code) {
    case exit_code::done:
        return "done";
    case exit_code::other:
        return "other";
    case exit_code::usage:
        return "usage";
    case exit_code::refused:
        return "refused";
    case exit_code::not_signed_in:
        return "not_signed_in";
    case exit_code::network:
        return "network";
    case exit_code::bad_http_answer:
        return "bad_http_answer";
    case exit_code::unreadable_answer:
        return "unreadable_answer";
    case exit_code::partly_done:
        return "partly_done";
    case exit_code::local_file:
        return "local_file";
    case exit_code::interrupted:
        return "interrupted";
    }
    return "other";
}

failure file_failure(const std::string &what, int error_number, std::string advice)
{
    if (advice.empty())
        advice = advice_against(error_number);
    return failure(exit_code::local_file,
                   what + ": " + std::generic_category().message(error_number), std::move(advice));
}

void after(const std::string &done, const std::function<void()> &step)
{
    try {
        step();
    } catch (failure &problem) {
        if (!done.empty()) {
            problem.code = exit_code::partly_done;
            problem.why = done + ", but " + problem.why;
        }
        throw;
    }
}

std::string line_of(const failure &problem)
{
    std::string line = "quillmere: " + escape_controls(problem.why);
    if (!problem.advice.empty())
        line += " (" + escape_controls(problem.advice) + ")";
    return line + "\n";
}

std::string json_of(const failure &problem)
{
    nlohmann::ordered_json error;
    error["code"] = nullptr;
    if (problem.status)
        error["code"] = *problem.status;
    error["kind"] = kind_of(problem.code);
    error["exit_code"] = static_cast<int>(problem.code);
    error["message"] = problem.why;
    if (!problem.advice.empty())
        error["advice"] = problem.advice;
    return json_line({{"error", error}});
}

} // namespace quillmere::tools
