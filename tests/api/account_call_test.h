// For the tests of single operations: what a call sends, and what it makes of a reply.
#pragma once

#include <gtest/gtest.h>

#include <ostream>
#include <string>

#include "api/account_operations.h"
#include "support/library_fixture.h"

namespace quillmere_test {

using account_call = call_outcome (*)();

// A call with some of its parameters in a state of their own, and the target that must be asked
// for.
struct request_case {
    const char *name;
    account_call call;
    std::string target;
};

inline std::ostream &operator<<(std::ostream &stream, const request_case &tested)
{
    return stream << tested.name;
}

inline std::string name_of_case(const testing::TestParamInfo<request_case> &tested)
{
    return tested.param.name;
}

class account_call_test : public library_test {
protected:
    // The outcome of a call whose reply is accepted and holds these elements.
    call_outcome with_elements(const std::string &elements, account_call call)
    {
        server.answer(xml_reply(accepted_reply(elements)));
        return call();
    }

    std::string target_of(account_call call)
    {
        with_elements("", call);
        return server.requests().back().target;
    }
};

inline call_outcome accepted(const std::string &results) { return {QM_OK, std::nullopt, results}; }

// What may stand in a URL as it is, and would mean something else if it were a part of the query's
// form or an escape.
constexpr const char *special =
    "a&b=c?d/e+f%20g;h:i@j,k'l\"m<n>o[p]q{r}s|t\\u^v`x~y-z._!()*$\xc3\xa9";

// Every byte that a text can hold.
inline const char *every_byte()
{
    static const std::string bytes = [] {
        std::string text;
        for (int byte = 1; byte < 256; ++byte)
            text += static_cast<char>(byte);
        return text;
    }();
    return bytes.c_str();
}

// The same, encoded: letters, digits and five other characters stand for themselves.
inline std::string every_byte_encoded()
{
    std::string text;
    for (const char *byte = every_byte(); *byte; ++byte) {
        char escape[4];
        std::snprintf(escape, sizeof escape, "%%%02x",
                      static_cast<unsigned>(static_cast<unsigned char>(*byte)));
        const std::string kept = "0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz"
                                 "!()*^";
        text += kept.find(*byte) == std::string::npos ? escape : std::string(1, *byte);
    }
    return text;
}

// What the two are in a target.
inline const std::string plain = special;
inline const std::string encoded = every_byte_encoded();

} // namespace quillmere_test
