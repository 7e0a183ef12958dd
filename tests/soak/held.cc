#include "soak/held.h"

#include <malloc.h>

#include <algorithm>

#include "support/resources.h"

namespace quillmere_test {
namespace {

// A block of the smallest size for each of ten thousand requests is more than either.
constexpr size_t resident_tolerance = 256 * 1024;
constexpr size_t in_use_tolerance = 16 * 1024;

struct measure {
    const char *name;
    size_t held::*value;
    size_t tolerance;
};

constexpr measure measures[] = {
    {"resident memory", &held::resident, resident_tolerance},
    {"heap in use", &held::in_use, in_use_tolerance},
    {"descriptors", &held::descriptors, 0},
    {"threads", &held::threads, 0},
};

size_t least_of_the_last(const std::vector<held> &moments, size_t held::*value)
{
    auto first = moments.size() > 5 ? moments.end() - 5 : moments.begin();
    auto less = [value](const held &left, const held &right) { return left.*value < right.*value; };
    return (*std::min_element(first, moments.end(), less)).*value;
}

} // namespace

held held_now()
{
    return {resident_bytes(), ::mallinfo2().uordblks, open_descriptors(), threads()};
}

std::string growth_in(const std::vector<held> &moments)
{
    std::string grown;
    for (const measure &each : measures) {
        size_t first = moments.front().*each.value;
        size_t last = least_of_the_last(moments, each.value);
        if (last > first + each.tolerance)
            grown += std::string(each.name) + ": from " + std::to_string(first) + " to " +
                     std::to_string(last) + "\n";
    }
    return grown;
}

} // namespace quillmere_test
