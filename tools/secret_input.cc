#include "secret_input.h"

#include <cerrno>

#include <fcntl.h>

#include "descriptor.h"
#include "failure.h"
#include "interrupt.h"

namespace quillmere::tools {

namespace {

enum class echo { shown, hidden };

constexpr const char *one_line = "it is one line of text, and nothing else";

/** The next byte in letter, or false at the end. */
bool read_letter(int number, char &letter, const std::string &name)
{
    for (;;) {
        const ssize_t count = ::read(number, &letter, 1);
        if (count >= 0)
            return count == 1;
        if (errno != EINTR)
            throw file_failure("cannot read the " + name, errno);
    }
}

void append_or_fail(secret_text &text, char letter, const std::string &name)
{
    if (letter == '\0')
        throw failure(exit_code::local_file, "the " + name + " contains a NUL byte", one_line);
    if (!text.append(letter))
        throw failure(exit_code::local_file,
                      "the " + name + " is longer than " + std::to_string(secret_text::longest) +
                          " bytes",
                      one_line);
}

secret_text prompt(const std::string &label, const std::string &advice, echo shown)
{
    const descriptor terminal(::open("/dev/tty", O_RDWR | O_NOCTTY | O_CLOEXEC));
    if (!terminal)
        throw failure(exit_code::usage, "there is no terminal to ask at: " + label, advice);

    const echo_pause quiet(terminal.number(), shown == echo::hidden);
    write_all(terminal.number(), label + ": ");
    secret_text text;
    char letter = 0;
    while (read_letter(terminal.number(), letter, label) && letter != '\n')
        append_or_fail(text, letter, label);
    if (shown == echo::hidden || letter != '\n')
        write_all(terminal.number(), "\n");
    if (text.empty())
        throw failure(exit_code::usage, "nothing was typed: " + label, advice);
    return text;
}

} // namespace

secret_text prompt_for_secret(const std::string &label, const std::string &advice)
{
    return prompt(label, advice, echo::hidden);
}

std::string prompt_for_text(const std::string &label, const std::string &advice)
{
    return std::string(prompt(label, advice, echo::shown).view());
}

secret_text secret_of(std::string_view text, const std::string &name)
{
    secret_text secret;
    for (const char letter : text)
        append_or_fail(secret, letter, name);
    return secret;
}

secret_text read_secret(int number, const std::string &name)
{
    secret_text text;
    char letter = 0;
    while (read_letter(number, letter, name))
        append_or_fail(text, letter, name);
    if (!text.empty() && text.view().back() == '\n')
        text.cut_last();
    if (!text.empty() && text.view().back() == '\r')
        text.cut_last();
    if (text.empty())
        throw failure(exit_code::local_file, "the " + name + " is empty", one_line);
    if (text.view().find('\n') != std::string_view::npos)
        throw failure(exit_code::local_file, "the " + name + " has more than one line", one_line);
    return text;
}

secret_text read_secret_file(const std::string &path, const std::string &name)
{
    if (path == "-")
        return read_secret(STDIN_FILENO, name);
    const descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY));
    if (!file)
        throw file_failure("cannot open the " + name + " in " + path, errno);
    return read_secret(file.number(), name);
}

} // namespace quillmere::tools
