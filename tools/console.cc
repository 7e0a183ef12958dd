#include "console.h"

#include "color.h"
#include "descriptor.h"
#include "text.h"

namespace quillmere::tools {

namespace {

constexpr std::string_view name = "quillmere:";

bool colored = false;

/** A line that begins with the name of the program. */
void write_line(const std::string &line, paint how)
{
    if (!colored)
        write_all(STDERR_FILENO, line);
    else
        write_all(STDERR_FILENO, painted(name, how) + line.substr(name.size()));
}

std::string line_with(const std::string &message)
{
    return std::string(name) + " " + escape_controls(message) + "\n";
}

} // namespace

void color_messages(bool wanted) { colored = wanted; }

bool messages_are_colored() { return colored; }

void warn(const std::string &message)
{
    write_line(line_with("warning: " + message), paint::caution);
}

void note(const std::string &message) { write_line(line_with(message), paint::heading); }

void complain(const failure &problem) { write_line(line_of(problem), paint::bad); }

} // namespace quillmere::tools
