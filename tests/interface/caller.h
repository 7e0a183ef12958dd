/* A program that calls the library: its settings, and the two ways in which it can reach the
   library, linked.c and loaded.c. */
#ifndef QUILLMERE_TEST_CALLER_H
#define QUILLMERE_TEST_CALLER_H

#include "quillmere.h"

struct settings {
    const char *library; /* the file to load, for a program that does */
    const char *base;
    const char *ca_path; /* or NULL */
    int32_t ssl_disabled;
    int64_t proxy_port; /* or 0 for no proxy */
    FILE *log;
    api_error_hook hook;
};

struct device_status {
    int32_t status;
    uint64_t revision;
    int32_t busy;
    char *error;
};

/* Writes the settings to the library's variables, starts it, makes one request and stops it. */
struct device_status ask_for_device_status(const struct settings *settings);

#endif
