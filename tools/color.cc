#include "color.h"

#include "text.h"

namespace quillmere::tools {

namespace {

constexpr std::string_view option = "--color";

color_choice choice_named(std::string_view word)
{
    if (word == "always")
        return color_choice::always;
    return word == "never" ? color_choice::never : color_choice::automatic;
}

const char *code_of(paint how)
{
    switch (how) {
    case paint::heading:
        return "1";
    case paint::folder:
        return "1;34";
    case paint::progress:
    case paint::good:
        return "32";
    case paint::caution:
        return "33";
    case paint::bad:
        return "1;31";
    }
    return "0";
}

} // namespace

color_choice color_choice_in(int count, const char *const *words)
{
    color_choice chosen = color_choice::automatic;
    for (int i = 1; i < count; ++i) {
        const std::string_view word = words[i];
        if (word == option && i + 1 < count)
            chosen = choice_named(words[i + 1]);
        else if (starts_with(word, option) && word.substr(option.size(), 1) == "=")
            chosen = choice_named(word.substr(option.size() + 1));
    }
    return chosen;
}

bool wants_color(color_choice choice, const environment &surroundings, bool is_terminal)
{
    if (choice != color_choice::automatic)
        return choice == color_choice::always;
    const auto terminal = surroundings.value("TERM");
    return is_terminal && terminal && *terminal != "dumb" && !surroundings.value("NO_COLOR");
}

std::string painted(std::string_view text, paint how)
{
    return "\x1b[" + std::string(code_of(how)) + "m" + std::string(text) + "\x1b[0m";
}

} // namespace quillmere::tools
