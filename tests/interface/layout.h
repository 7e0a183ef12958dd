// Where the fields of the public structures lie for a C program.
#ifndef QUILLMERE_TEST_LAYOUT_H
#define QUILLMERE_TEST_LAYOUT_H

#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

struct layout_entry {
    const char *what;
    size_t actual;
    size_t expected;
};

extern const struct layout_entry layout_entries[];
extern const size_t layout_entry_count;

#ifdef __cplusplus
}
#endif

#endif
