// How secrets come in: typed at the terminal without echo, from standard input, or from a file.
// Never from the argument list, which every user of the machine can read.
#pragma once

#include <string>
#include <string_view>

#include "secret_text.h"

namespace quillmere::tools {

/** What is typed at the controlling terminal after the label; advice says what to do without one.
 */
secret_text prompt_for_secret(const std::string &label, const std::string &advice);

/** The same for a text that may be seen while it is typed. */
std::string prompt_for_text(const std::string &label, const std::string &advice);

/** A text that is already in memory, such as a variable of the environment. */
secret_text secret_of(std::string_view text, const std::string &name);

/**
 * The one line that a descriptor holds, without its line end.
 *
 * @param name what to call it in a failure: there is one for an empty text, more than one line, a
 * NUL, or more than secret_text::longest bytes
 */
secret_text read_secret(int number, const std::string &name);

/** read_secret() on a file; "-" is standard input. */
secret_text read_secret_file(const std::string &path, const std::string &name);

} // namespace quillmere::tools
