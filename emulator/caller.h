// Who asks, by the session that a request names.
#pragma once

#include <cstdint>

#include "service.h"

namespace emulator {

enum class session_need { none, optional, required };

/** The account, or 0 where no session is needed and none was given. Throws a refusal otherwise. */
std::int64_t account_of_session(const parameters &given, session_need need, service &state);

} // namespace emulator
