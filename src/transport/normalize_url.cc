// Gives links a scheme where the service left it out.
#include <cstring>

#include "owned.h"
#include "quillmere.h"

namespace quillmere {

namespace {

// The link's first "//" that has a byte behind it, or null.
const char *slashes_in(const char *url)
{
    const char *slashes = std::strstr(url, "//");
    return slashes && slashes[2] != '\0' ? slashes : nullptr;
}

bool lacks_scheme(const char *url)
{
    const char *slashes = slashes_in(url);
    return slashes && (slashes == url || slashes[-1] != ':');
}

} // namespace

} // namespace quillmere

using namespace quillmere;

char *normalize_url(const char *url, const char *scheme)
{
    if (!url)
        return nullptr;
    if (!scheme || !lacks_scheme(url))
        return string_dup(url);

    owned_buffer normalized(string_new(std::strlen(scheme) + 1 + std::strlen(url) + 1));
    string_append(normalized.get(), scheme);
    string_append(normalized.get(), ":");
    string_append(normalized.get(), url);
    char *text = normalized->bytes;
    string_delete(normalized.release(), 0);
    return text;
}
