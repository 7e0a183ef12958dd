// The operations in one form, for tests of what they have in common.
#pragma once

#include <iosfwd>
#include <optional>
#include <string>

#include "quillmere.h"
#include "support/taken_text.h"

namespace quillmere_test {

struct performed {
    int32_t status;
    std::optional<std::string> message; // none for NULL
    bool handed_out;                    // a record, a token, or numbers that are not 0
};

// The lines that an operation logs of a reply.
enum class logged_reply { none, text, text_and_length };

struct operation {
    const char *name;
    performed (*perform)();   // with out-parameters that hold rubbish before
    const char **path;        // the exported variable
    const char *query;        // behind the path
    const char *logged_query; // as the log shows it
    const char *url_heading;  // what the log says before the URL; null: it does not show it
    logged_reply reply;       // what the log says of the reply
    const char *payload;      // what a successful reply holds beside its result
    bool explains_failed_exchange;

    std::string target() const { return std::string(*path) + query; }

    // All that a call logs, if the exchange itself logs nothing.
    std::string whole_log(const std::string &reply_text) const;
    std::string url_log() const;
    std::string reply_log(const std::optional<std::string> &reply_text) const;

    std::string success() const;
};

void PrintTo(const operation &each, std::ostream *out);

extern const operation operations[6];

// A place for get_login_token's pkey, which the library frees when the reply is malformed.
class pkey_slot {
public:
    pkey_slot();

    char **place() const { return place_; }

    // What the slot holds, after which it is gone. Not after a malformed reply.
    std::optional<std::string> take();

private:
    char **place_;
};

} // namespace quillmere_test
