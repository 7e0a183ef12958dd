// What a process holds of the system, for tests that must leave nothing behind.
#pragma once

#include <cstddef>

#include <sys/types.h>

namespace quillmere_test {

constexpr pid_t this_process = 0;

size_t open_descriptors(pid_t process = this_process);
size_t threads(pid_t process = this_process);

// Memory that is present, and the most that ever was.
size_t resident_bytes(pid_t process = this_process);
size_t peak_resident_bytes(pid_t process = this_process);

} // namespace quillmere_test
