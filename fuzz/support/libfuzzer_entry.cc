// Where the fuzzer comes in. A program for it holds one target.
#include <cstddef>
#include <cstdint>

#include "support/target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *bytes, size_t length);

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *bytes, size_t length)
{
    // The fuzzer may hand over no bytes at all, and then a null pointer.
    const char *start = length > 0 ? reinterpret_cast<const char *>(bytes) : "";
    quillmere_fuzz::known_targets().front().try_input({start, length});
    return 0;
}
