#include "console.h"

#include "descriptor.h"
#include "text.h"

namespace quillmere::tools {

void warn(const std::string &message) { note("warning: " + message); }

void note(const std::string &message)
{
    write_all(STDERR_FILENO, "quillmere: " + escape_controls(message) + "\n");
}

} // namespace quillmere::tools
