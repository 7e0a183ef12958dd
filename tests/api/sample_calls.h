// Sample calls of the operations that need no account's tree, each with all that came out of it.
#pragma once

#include "api/account_calls.h"
#include "api/operations.h"

namespace quillmere_test {

struct sample_call {
    const operation &of;
    call_outcome (*call)();
};

// All but get_login_token.
extern const sample_call sample_calls[5];

// get_login_token, which frees the slot and loses what it holds when the reply is malformed.
call_outcome login_token_call(pkey_slot &pkey);

} // namespace quillmere_test
