// A text that the library has handed out, taken over.
#pragma once

#include <optional>
#include <string>

#include "quillmere.h"

namespace quillmere_test {

// Nothing for NULL. The text is released.
inline std::optional<std::string> taken(char *text)
{
    std::optional<std::string> copy;
    if (text)
        copy = text;
    api_free(text);
    return copy;
}

} // namespace quillmere_test
