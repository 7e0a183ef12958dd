#include "caller.h"

#include "errors.h"
#include "store/sessions.h"

namespace emulator {

std::int64_t account_of_session(const parameters &given, session_need need, service &state)
{
    if (need == session_need::none)
        return 0;
    const auto token = given.find("session_token");
    const bool is_given = token != given.end() && !token->second.empty();
    if (!is_given && need == session_need::optional)
        return 0;
    if (!is_given)
        throw refusal(error::session_invalid);
    const auto account =
        use_session(state.store, token->second, {state.now(), state.session_lifetime});
    if (!account)
        throw refusal(error::session_invalid);
    return *account;
}

} // namespace emulator
