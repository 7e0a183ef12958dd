// Tells the leak checker of what the library leaves behind on purpose. deliberate_leak.supp tells
// valgrind.
#pragma once

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define QUILLMERE_TEST_LEAK_CHECKER
#endif
#elif defined(__SANITIZE_ADDRESS__)
#define QUILLMERE_TEST_LEAK_CHECKER
#endif

#ifdef QUILLMERE_TEST_LEAK_CHECKER
#include <sanitizer/lsan_interface.h>
#endif

namespace quillmere_test {

// What this thread allocates while it lives, and nothing else, may be lost.
class deliberate_leak {
public:
#ifdef QUILLMERE_TEST_LEAK_CHECKER
    deliberate_leak() { __lsan_disable(); }
    ~deliberate_leak() { __lsan_enable(); }
#else
    deliberate_leak() {}
    ~deliberate_leak() {}
#endif
    deliberate_leak(const deliberate_leak &) = delete;
    deliberate_leak &operator=(const deliberate_leak &) = delete;
};

} // namespace quillmere_test
