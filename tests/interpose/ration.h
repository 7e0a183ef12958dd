// So much of something, then none.
#pragma once

#include <cstddef>

namespace quillmere_test {

struct ration {
    size_t allowed = 0;
    size_t refusals = 0; // after which there is plenty again
    size_t refused = 0;  // so far

    bool refuses()
    {
        if (allowed > 0) {
            --allowed;
            return false;
        }
        if (refused == refusals)
            return false;
        ++refused;
        return true;
    }
};

} // namespace quillmere_test
