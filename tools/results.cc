#include "results.h"

#include <algorithm>
#include <cerrno>

#include <fcntl.h>

#include "failure.h"
#include "text.h"

namespace quillmere::tools {

namespace {

std::string shown(const nlohmann::ordered_json &value, bool for_terminal)
{
    if (value.is_null())
        return "-";
    if (value.is_boolean())
        return value.get<bool>() ? "yes" : "no";
    if (!value.is_string())
        return value.dump();
    const auto &text = value.get_ref<const std::string &>();
    return for_terminal ? escape_controls(text) : text;
}

} // namespace

std::string facts_as_text(const std::vector<fact> &facts, bool for_terminal)
{
    std::size_t widest = 0;
    for (const fact &each : facts)
        widest = std::max(widest, columns(each.label));

    std::string lines;
    for (const fact &each : facts) {
        lines += each.label;
        lines.append(widest - columns(each.label) + 2, ' ');
        lines += shown(each.value, for_terminal) + "\n";
    }
    return lines;
}

std::string facts_as_json(const std::vector<fact> &facts)
{
    nlohmann::ordered_json document = nlohmann::ordered_json::object();
    for (const fact &each : facts)
        document[each.key] = each.value;
    return json_line(document);
}

results::results() : output_(::fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, STDERR_FILENO + 1))
{
    terminal_ = ::isatty(output_.number()) == 1;
    const descriptor nowhere(::open("/dev/null", O_WRONLY | O_CLOEXEC));
    if (nowhere)
        ::dup2(nowhere.number(), STDOUT_FILENO);
}

void results::facts(const std::vector<fact> &facts)
{
    write(format_ == result_format::json ? facts_as_json(facts) : facts_as_text(facts, terminal_));
}

void results::sentence(const std::string &sentence, const std::vector<fact> &facts)
{
    const std::string line = (terminal_ ? escape_controls(sentence) : sentence) + "\n";
    write(format_ == result_format::json ? facts_as_json(facts) : line);
}

void results::write(std::string_view text)
{
    if (!write_all(output_.number(), text))
        throw file_failure("cannot write to standard output", errno);
}

} // namespace quillmere::tools
