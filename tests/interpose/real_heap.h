// The C library's own functions, in a program in which the linker leads their names elsewhere.
#pragma once

#include <cstddef>

extern "C" {

void *real_malloc(size_t size) __asm__("__real_malloc");
void *real_calloc(size_t count, size_t size) __asm__("__real_calloc");
void *real_realloc(void *block, size_t size) __asm__("__real_realloc");
char *real_strdup(const char *text) __asm__("__real_strdup");
void real_free(void *block) __asm__("__real_free");

} // extern "C"
