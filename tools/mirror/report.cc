#include "report.h"

#include <algorithm>

#include "../console.h"
#include "../results.h"
#include "../text.h"
#include "../transfers/progress.h"

namespace quillmere::tools {

namespace {

struct action_words {
    mirror_action action;
    const char *json;
    const char *done;     // "fetched 3 files"
    const char *foreseen; // "fetch 3 files"
};

constexpr action_words words[] = {{mirror_action::made, "made", "made ", "make "},
                                  {mirror_action::fetched, "fetched", "fetched ", "fetch "},
                                  {mirror_action::moved, "moved", "moved ", "move "},
                                  {mirror_action::removed, "removed", "removed ", "remove "},
                                  {mirror_action::kept, "kept", "kept ", "keep "}};

const char *json_word_for(mirror_action action)
{
    for (const action_words &each : words)
        if (each.action == action)
            return each.json;
    return "";
}

std::string counted(std::size_t count, const std::string &one, const std::string &many)
{
    return std::to_string(count) + " " + (count == 1 ? one : many);
}

bool concerns_one_entry(const failure &problem)
{
    return problem.code == exit_code::refused || problem.code == exit_code::local_file ||
           problem.code == exit_code::unreadable_answer;
}

} // namespace

std::string mirror_report::local_path_of(const std::string &path) const
{
    return path_below(local_path_, path);
}

void mirror_report::add(mirror_step step) { steps_.push_back(std::move(step)); }

void mirror_report::keep(entry_kind kind, const std::string &path, const std::string &former_path)
{
    const std::string stays = either("it stays", "it would stay");
    if (path == former_path && kind == entry_kind::folder)
        note(local_path_of(path) + " is no longer the account's; " + stays +
             " for what else it holds");
    else if (path == former_path)
        note(local_path_of(path) + " is no longer the account's; " + stays +
             ", as it was changed here");
    else
        note(local_path_of(former_path) + " is not the account's; it " + either("is", "would be") +
             " kept as " + local_path_of(path));
    add({mirror_action::kept, kind, {}, path, path == former_path ? "" : former_path, 0});
}

void mirror_report::attempt(const std::function<void()> &step)
{
    try {
        step();
    } catch (const failure &problem) {
        if (!concerns_one_entry(problem))
            after(steps_.empty() ? "" : sentence(), [] { throw; });
        count_failure(problem);
    }
}

void mirror_report::count_failure(const failure &problem)
{
    note(problem.why + (problem.advice.empty() ? "" : " (" + problem.advice + ")"));
    if (failures_++ == 0)
        first_failure_ = problem;
}

void mirror_report::leave_out(const std::vector<left_out_entry> &entries)
{
    std::set<std::string> now;
    for (const left_out_entry &each : entries) {
        now.insert(each.key);
        if (left_out_.count(each.key) == 0)
            note(path_below(remote_path_, each.path) + " (key:" + each.key +
                 ") is left out: " + each.why);
    }
    left_out_ = std::move(now);
}

void mirror_report::tell(results &output, const known_account &account)
{
    auto rows = nlohmann::ordered_json::array();
    for (const mirror_step &each : steps_)
        rows.push_back(
            {{"action", json_word_for(each.action)},
             {"kind", word_for(each.kind)},
             {"key", text_unless_empty(each.key)},
             {"path", each.path},
             {"former_path", text_unless_empty(each.former_path)},
             {"size", each.action == mirror_action::fetched ? nlohmann::ordered_json(each.size)
                                                            : nlohmann::ordered_json(nullptr)}});
    std::string text = sentence();
    text.front() = *either("M", "W");
    output.sentence(steps_.empty() ? local_path_ + " is up to date" : text,
                    {{"key", nullptr, account.root},
                     {"device_revision", nullptr, account.revision},
                     {"steps", nullptr, std::move(rows)}});
    steps_.clear();
}

void mirror_report::require_success() const
{
    const std::string lacking = incompleteness();
    if (lacking.empty())
        return;
    if (steps_.empty() && left_out_.empty() && first_failure_)
        throw failure(first_failure_->code, lacking, first_failure_->advice);
    throw failure(exit_code::partly_done, sentence() + ", but " + lacking);
}

void mirror_report::note_incomplete() const
{
    const std::string lacking = incompleteness();
    if (!lacking.empty())
        note(local_path_ + " is not all of " + remote_path_ + ": " + lacking);
}

// "mirrored /photos to backup: fetched 3 files (1.2 MiB), moved 2"
std::string mirror_report::sentence() const
{
    std::string done;
    for (const action_words &word : words) {
        std::size_t count = 0;
        std::uint64_t bytes = 0;
        for (const mirror_step &each : steps_) {
            count += each.action == word.action ? 1 : 0;
            bytes += each.action == word.action ? each.size : 0;
        }
        if (count == 0)
            continue;
        done += done.empty() ? ": " : ", ";
        done += either(word.done, word.foreseen);
        done += word.action == mirror_action::made      ? counted(count, "folder", "folders")
                : word.action == mirror_action::fetched ? counted(count, "file", "files")
                                                        : std::to_string(count);
        if (word.action == mirror_action::fetched)
            done += " (" + size_text(bytes) + ")";
    }
    return either("mirrored ", "would mirror ") + remote_path_ + " to " + local_path_ + done;
}

std::string mirror_report::incompleteness() const
{
    std::string text;
    if (failures_ > 0)
        text = counted(failures_, "step", "steps") + " failed, the first because " +
               first_failure_->why;
    if (!left_out_.empty())
        text += (text.empty() ? "" : ", and ") +
                counted(left_out_.size(), "entry is left out", "entries are left out");
    return text;
}

} // namespace quillmere::tools
