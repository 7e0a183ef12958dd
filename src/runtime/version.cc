// The version of the library, made of the header's numbers, which are its one source.
#include "quillmere.h"

#define TEXT_OF(number) #number
#define VERSION_TEXT(major, minor, patch) TEXT_OF(major) "." TEXT_OF(minor) "." TEXT_OF(patch)

const char *quillmere_version(void)
{
    return VERSION_TEXT(QUILLMERE_VERSION_MAJOR, QUILLMERE_VERSION_MINOR, QUILLMERE_VERSION_PATCH);
}
