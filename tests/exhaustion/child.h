// A piece of work in a process of its own, for work that may end in an abort.
#pragma once

#include <functional>
#include <optional>
#include <string>

namespace quillmere_test {

struct child_end {
    std::optional<int> signal; // of a child that was killed
    std::string told;          // what the work returned
    std::string err;           // what was written to standard error
};

// The process must have no other threads: a fork takes over locks, but not the threads that hold
// them. A child that hangs is killed by SIGALRM.
child_end in_child(const std::function<std::string()> &work);

} // namespace quillmere_test
