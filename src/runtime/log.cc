// The diagnostic log: one function, one stream, no levels.
#include <cstdarg>
#include <cstdio>

#include "quillmere.h"

FILE *output_file = nullptr;

int32_t qm_printf(const char *format, ...)
{
    FILE *stream = output_file ? output_file : stdout;

    std::va_list arguments;
    va_start(arguments, format);
    std::vfprintf(stream, format, arguments);
    va_end(arguments);

    return std::fflush(stream);
}

void set_quillmere_output_file(FILE *stream) { output_file = stream; }

void set_output_file(FILE *stream) { set_quillmere_output_file(stream); }

void set_windows_output_file(FILE *) {}

void print_curl_version_info(void) {}
