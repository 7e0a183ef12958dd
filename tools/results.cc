#include "results.h"

#include <algorithm>
#include <cerrno>

#include <fcntl.h>

#include "color.h"
#include "failure.h"
#include "text.h"

namespace quillmere::tools {

namespace {

std::string as_shown(const std::string &text, text_style style)
{
    return style == text_style::plain ? text : escape_controls(text);
}

std::string shown(const nlohmann::ordered_json &value, text_style style)
{
    if (value.is_null())
        return "-";
    if (value.is_boolean())
        return value.get<bool>() ? "yes" : "no";
    if (!value.is_string())
        return value.dump();
    return as_shown(value.get_ref<const std::string &>(), style);
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

text_column text_column_of(const result_table &whole, const column &wanted, text_style style)
{
    text_column made;
    made.cells.push_back(wanted.label);
    bool only_numbers = true;
    for (const std::vector<fact> &row : whole.rows) {
        const nlohmann::ordered_json *const value = value_of(row, wanted.key);
        made.cells.push_back(value == nullptr ? "-" : shown(*value, style));
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

std::string with_paint(const std::string &text, paint how, text_style style)
{
    return style == text_style::colored ? painted(text, how) : text;
}

/** What a row is called, as it is shown. */
std::string name_of(const std::vector<fact> &row, const std::string &name, text_style style)
{
    const nlohmann::ordered_json *const kind = value_of(row, "kind");
    const bool folder = kind != nullptr && *kind == "folder";
    return folder ? with_paint(name, paint::folder, style) : name;
}

std::string padded(const text_column &column, std::size_t line)
{
    const std::string &cell = column.cells[line];
    const std::string blanks(column.width - columns(cell), ' ');
    return column.numbers ? blanks + cell : cell + blanks;
}

} // namespace

std::string facts_as_text(const std::vector<fact> &facts, text_style style)
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
        lines += shown(each.value, style) + "\n";
    }
    return lines;
}

std::string facts_as_json(const std::vector<fact> &facts) { return json_line(object_of(facts)); }

std::string groups_as_text(const std::vector<fact_group> &groups, text_style style)
{
    std::vector<fact> known;
    for (const fact_group &group : groups)
        for (const fact &each : group.facts)
            if (!each.value.is_null() && each.value != "")
                known.push_back(each);
    return facts_as_text(known, style);
}

std::string groups_as_json(const std::vector<fact_group> &groups)
{
    auto document = nlohmann::ordered_json::object();
    for (const fact_group &group : groups)
        document[group.key] = object_of(group.facts);
    return json_line(document);
}

std::string table_as_text(const result_table &shown, text_style style)
{
    if (shown.rows.empty())
        return {};
    std::vector<text_column> all;
    for (const column &each : shown.columns)
        all.push_back(text_column_of(shown, each, style));

    std::string lines;
    for (std::size_t line = 0; line <= shown.rows.size(); ++line) {
        std::string before;
        for (const text_column &each : all)
            if (&each != &all.back())
                before += padded(each, line) + "  ";
        const std::string &last = all.back().cells[line];
        if (line == 0)
            lines += with_paint(before + last, paint::heading, style) + "\n";
        else
            lines += before + name_of(shown.rows[line - 1], last, style) + "\n";
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
    set_colors(false);
    const descriptor nowhere(::open("/dev/null", O_WRONLY | O_CLOEXEC));
    if (nowhere)
        ::dup2(nowhere.number(), STDOUT_FILENO);
}

void results::set_colors(bool colored)
{
    style_ = terminal_ ? text_style::terminal : text_style::plain;
    if (colored)
        style_ = text_style::colored;
}

void results::facts(const std::vector<fact> &facts)
{
    write(format_ == result_format::json ? facts_as_json(facts) : facts_as_text(facts, style_));
}

void results::groups(const std::vector<fact_group> &groups)
{
    write(format_ == result_format::json ? groups_as_json(groups) : groups_as_text(groups, style_));
}

void results::rows(const std::vector<fact> &about, const result_table &shown)
{
    if (format_ == result_format::json)
        return write(table_as_json(about, shown));
    const std::string above = facts_as_text(about, style_);
    const std::string below = table_as_text(shown, style_);
    write(above + (above.empty() || below.empty() ? "" : "\n") + below);
}

void results::lines(const std::vector<std::string> &lines, const result_table &shown)
{
    if (format_ == result_format::json)
        return write(table_as_json({}, shown));
    std::string text;
    for (std::size_t i = 0; i < lines.size(); ++i)
        text += name_of(shown.rows[i], as_shown(lines[i], style_), style_) + "\n";
    write(text);
}

void results::sentence(const std::string &sentence, const std::vector<fact> &facts)
{
    const std::string line = as_shown(sentence, style_) + "\n";
    write(format_ == result_format::json ? facts_as_json(facts) : line);
}

void results::write(std::string_view text)
{
    if (!write_all(output_.number(), text))
        throw file_failure("cannot write to standard output", errno);
}

} // namespace quillmere::tools
