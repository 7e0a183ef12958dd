// The operations on an account, a row each: one sample call with all that is to be seen of it.
#pragma once

#include <ostream>
#include <string>

#include "api/account_calls.h"

namespace quillmere_test {

enum class error_reading { standard, direct };

struct account_operation {
    const char *name;
    const char **path_variable;
    const char *path;
    const char *query; // of the sample call
    const char *entry_line;
    const char *url_heading;   // NULL: the URL is not logged
    const char *reply_heading; // NULL: the reply is not logged
    bool logs_length;
    error_reading errors;
    bool explains_failures; // transport failures have a message
    const char *elements;   // of an accepted reply, behind its result
    const char *extraction_lines;
    const char *results; // of that reply
    const char *nothing; // what the results are when a call fails
    call_outcome (*call)();

    std::string target() const { return std::string(path) + query; }
    std::string accepted_reply() const;

    // The whole log of the sample call, up to the reply's handling. An empty reply is logged as
    // "(null)".
    std::string log_of(const std::string &base, const std::string &reply) const;
};

std::string accepted_reply(const std::string &elements);

// A reply with another result than "Success".
std::string refusing_reply(const std::string &elements);

extern const account_operation account_operations[20];

// For GoogleTest's messages and names.
inline std::ostream &operator<<(std::ostream &stream, const account_operation &operation)
{
    return stream << operation.name;
}

} // namespace quillmere_test
