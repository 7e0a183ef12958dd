// How the test support reports that it cannot do its work: an exception, which fails the one test
// that needed it and names the call.
#pragma once

#include <cerrno>
#include <chrono>
#include <string>
#include <system_error>

namespace quillmere_test {

// How long a wait may take before the test is called failed. Events end every wait long before,
// also under valgrind on a busy machine.
constexpr std::chrono::seconds patience{60};

// What a wait in poll() has left of its deadline, never negative, which would mean for ever.
inline int milliseconds_until(std::chrono::steady_clock::time_point deadline)
{
    auto left =
        std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    return left.count() > 0 ? static_cast<int>(left.count()) : 0;
}

inline void require(bool good, const std::string &call)
{
    if (!good)
        throw std::system_error(errno, std::generic_category(), call);
}

} // namespace quillmere_test
