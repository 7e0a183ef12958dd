#include "interpose/clock.h"

#include <atomic>

namespace quillmere_test {
namespace {

std::atomic<std::time_t> pretended{0};

} // namespace

pretended_time::pretended_time(std::time_t now) { pretended = now; }
pretended_time::~pretended_time() { pretended = 0; }

} // namespace quillmere_test

using namespace quillmere_test;

// The linker gives the library's calls to the __wrap_ name.
extern "C" {

std::time_t real_time(std::time_t *result) __asm__("__real_time");
std::time_t time_as_pretended(std::time_t *result) __asm__("__wrap_time");

std::time_t time_as_pretended(std::time_t *result)
{
    if (pretended == 0)
        return real_time(result);
    if (result)
        *result = pretended;
    return pretended;
}

} // extern "C"
