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

nlohmann::ordered_json object_of(const std::vector<fact> &facts)
{
    auto object = nlohmann::ordered_json::object();
    for (const fact &each : facts)
        object[each.key] = each.value;
    return object;
}

struct text_column {
    std::vector<std::string> cells; // the heading first
    std::size_t width = 0;
    bool numbers = false; // all of them, or nothing
};

const nlohmann::ordered_json *value_of(const std::vector<fact> &row, std::string_view key)
{
    for (const fact &each : row)
        if (each.key == key)
            return &each.value;
    return nullptr;
}

text_column text_column_of(const result_table &whole, const column &wanted, bool for_terminal)
{
    text_column made;
    made.cells.push_back(wanted.label);
    bool only_numbers = true;
    for (const std::vector<fact> &row : whole.rows) {
        const nlohmann::ordered_json *const value = value_of(row, wanted.key);
        made.cells.push_back(value == nullptr ? "-" : shown(*value, for_terminal));
        if (value == nullptr || value->is_null())
            continue;
        made.numbers = true;
        only_numbers = only_numbers && value->is_number();
    }
    made.numbers = made.numbers && only_numbers;
    for (const std::string &cell : made.cells)
        made.width = std::max(made.width, columns(cell));
    return made;
}

std::string padded(const text_column &column, std::size_t line)
{
    const std::string &cell = column.cells[line];
    const std::string blanks(column.width - columns(cell), ' ');
    return column.numbers ? blanks + cell : cell + blanks;
}

} // namespace

std::string facts_as_text(const std::vector<fact> &facts, bool for_terminal)
{
    std::size_t widest = 0;
    for (const fact &each : facts)
        if (each.label != nullptr)
            widest = std::max(widest, columns(each.label));

    std::string lines;
    for (const fact &each : facts) {
        if (each.label == nullptr)
            continue;
        lines += each.label;
        lines.append(widest - columns(each.label) + 2, ' ');
        lines += shown(each.value, for_terminal) + "\n";
    }
    return lines;
}

std::string facts_as_json(const std::vector<fact> &facts) { return json_line(object_of(facts)); }

std::string groups_as_text(const std::vector<fact_group> &groups, bool for_terminal)
{
    std::vector<fact> known;
    for (const fact_group &group : groups)
        for (const fact &each : group.facts)
            if (!each.value.is_null() && each.value != "")
                known.push_back(each);
    return facts_as_text(known, for_terminal);
}

std::string groups_as_json(const std::vector<fact_group> &groups)
{
    auto document = nlohmann::ordered_json::object();
    for (const fact_group &group : groups)
        document[group.key] = object_of(group.facts);
    return json_line(document);
}

std::string table_as_text(const result_table &shown, bool for_terminal)
{
    if (shown.rows.empty())
        return {};
    std::vector<text_column> all;
    for (const column &each : shown.columns)
        all.push_back(text_column_of(shown, each, for_terminal));

    std::string lines;
    for (std::size_t line = 0; line <= shown.rows.size(); ++line) {
        for (const text_column &each : all)
            lines += &each == &all.back() ? each.cells[line] + "\n" : padded(each, line) + "  ";
    }
    return lines;
}

std::string table_as_json(const std::vector<fact> &about, const result_table &shown)
{
    auto document = object_of(about);
    auto &rows = document[shown.key] = nlohmann::ordered_json::array();
    for (const std::vector<fact> &row : shown.rows)
        rows.push_back(object_of(row));
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

void results::groups(const std::vector<fact_group> &groups)
{
    write(format_ == result_format::json ? groups_as_json(groups)
                                         : groups_as_text(groups, terminal_));
}

void results::rows(const std::vector<fact> &about, const result_table &shown)
{
    if (format_ == result_format::json)
        return write(table_as_json(about, shown));
    const std::string above = facts_as_text(about, terminal_);
    const std::string below = table_as_text(shown, terminal_);
    write(above + (above.empty() || below.empty() ? "" : "\n") + below);
}

void results::lines(const std::vector<std::string> &lines, const result_table &shown)
{
    if (format_ == result_format::json)
        return write(table_as_json({}, shown));
    std::string text;
    for (const std::string &line : lines)
        text += (terminal_ ? escape_controls(line) : line) + "\n";
    write(text);
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
