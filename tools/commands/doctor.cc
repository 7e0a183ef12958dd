// What is wrong, and what to try.

#include "commands.h"

#include <cstdio>

#include "../color.h"
#include "../doctor/examination.h"
#include "../text.h"

namespace quillmere::tools {

namespace {

constexpr std::size_t result_columns = 9; // "skipped" and two blanks
constexpr std::size_t step_name_columns = 10;
constexpr std::size_t time_columns = 9; // "12345.6 ms" would stick out, as it should

double milliseconds_of(std::chrono::microseconds time)
{
    return static_cast<double>(time.count()) / 1000;
}

std::string time_text(const examined_step &step)
{
    if (!step.time)
        return "";
    char text[32];
    std::snprintf(text, sizeof text, "%.1f ms", milliseconds_of(*step.time));
    return text;
}

paint paint_for(finding result)
{
    switch (result) {
    case finding::ok:
        return paint::good;
    case finding::failed:
        return paint::bad;
    case finding::skipped:
        return paint::caution;
    }
    return paint::bad;
}

std::string blanks_behind(const std::string &text, std::size_t width)
{
    return std::string(width - std::min(width, text.size()), ' ');
}

std::string line_for(const examined_step &step, text_style style)
{
    const std::string word = word_for(step.result);
    const std::string name = step.name;
    const std::string time = time_text(step);
    const std::string shown =
        style == text_style::colored ? painted(word, paint_for(step.result)) : word;
    std::string line = shown + blanks_behind(word, result_columns) + name +
                       blanks_behind(name, step_name_columns) + blanks_behind(time, time_columns) +
                       time + "  " + escape_controls(step.detail);
    if (!step.advice.empty())
        line += " (" + escape_controls(step.advice) + ")";
    return line + "\n";
}

std::vector<fact> facts_of_step(const examined_step &step)
{
    nlohmann::ordered_json time = nullptr;
    if (step.time)
        time = milliseconds_of(*step.time);
    return {{"step", nullptr, step.name},
            {"result", nullptr, word_for(step.result)},
            {"milliseconds", nullptr, time},
            {"detail", nullptr, step.detail},
            {"advice", nullptr, text_unless_empty(step.advice)}};
}

void tell(const examination &steps, bool healthy, results &output)
{
    if (output.format() == result_format::json) {
        result_table table = {"steps", {}, {}};
        for (const examined_step &each : steps)
            table.rows.push_back(facts_of_step(each));
        return output.rows({{"healthy", nullptr, healthy}}, table);
    }
    std::string text;
    for (const examined_step &each : steps)
        text += line_for(each, output.style());
    output.write(text);
}

} // namespace

void run_doctor(command_context &context)
{
    const examination steps = examine(context);
    const auto first = std::find_if(steps.begin(), steps.end(), [](const examined_step &each) {
        return each.result == finding::failed;
    });
    tell(steps, first == steps.end(), context.output);
    if (first != steps.end())
        throw told_failure{first->code};
}

} // namespace quillmere::tools
