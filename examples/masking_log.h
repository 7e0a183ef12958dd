/* A log stream that takes the secrets out. The library's log has passwords, tokens and signatures
 * in clear; through this stream they become "(masked)":
 *
 *     FILE *log = masking_log_new(stderr);
 *     set_output_file(log);
 *     ... requests ...
 *     set_output_file(NULL);
 *     fclose(log);
 *
 * It is no part of the library: copy it, and add the names that are secret in your application. */
#ifndef MASKING_LOG_H
#define MASKING_LOG_H

#include <stdio.h>

/* Makes a stream that writes to another one, which the caller keeps open for as long. Returns NULL
 * when the memory does not suffice. */
FILE *masking_log_new(FILE *to);

#endif
