// Stands in for the application's check_api_error hook and keeps what it was told.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "quillmere.h"

namespace quillmere_test {

struct hook_call {
    std::optional<std::string> url; // each without a value where NULL was passed
    std::optional<std::string> response;
    int32_t status;
    std::optional<std::string> message;
};

// Installs itself while it lives. One at a time: a hook has no argument to tell recorders apart by.
class hook_recorder {
public:
    hook_recorder();
    ~hook_recorder();
    hook_recorder(const hook_recorder &) = delete;
    hook_recorder &operator=(const hook_recorder &) = delete;

    std::vector<hook_call> calls() const;

private:
    api_error_hook before_;
};

} // namespace quillmere_test
