#include "report.h"

#include <algorithm>
#include <cctype>

#include "../console.h"
#include "progress.h"

namespace quillmere::tools {

namespace {

const char *word_for(outcome how)
{
    switch (how) {
    case outcome::created:
        return "created";
    case outcome::revised:
        return "revised";
    case outcome::unchanged:
        return "unchanged";
    case outcome::downloaded:
        return "downloaded";
    }
    return "unchanged";
}

std::string sentence_for(const transferred &file)
{
    switch (file.how) {
    case outcome::created:
        return "Uploaded " + file.source + " to " + file.target;
    case outcome::revised:
        return "Uploaded " + file.source + " as a new revision of " + file.target;
    case outcome::downloaded:
        return "Downloaded " + file.source + " to " + file.target;
    case outcome::unchanged:
        break;
    }
    return file.target + " is up to date";
}

std::string files_text(std::size_t count)
{
    return std::to_string(count) + (count == 1 ? " file" : " files");
}

std::string capitalized(std::string text)
{
    text.front() = static_cast<char>(std::toupper(static_cast<unsigned char>(text.front())));
    return text;
}

bool concerns_one_file(const failure &problem)
{
    switch (problem.code) {
    case exit_code::refused:
    case exit_code::local_file:
    case exit_code::bad_http_answer:
    case exit_code::unreadable_answer:
        return true;
    default:
        return false;
    }
}

} // namespace

void transfer_report::add(transferred file) { files_.push_back(std::move(file)); }

void transfer_report::attempt(const std::function<void()> &step)
{
    try {
        step();
    } catch (const failure &problem) {
        if (kind_ == batch::one)
            throw;
        if (!concerns_one_file(problem))
            after(files_.empty() ? "" : sentence(), [] { throw; });
        note(problem.why + (problem.advice.empty() ? "" : " (" + problem.advice + ")"));
        ++failures_;
        if (!first_failure_)
            first_failure_ = problem;
    }
}

void transfer_report::require_success() const
{
    if (failures_ == 0)
        return;
    const std::string failed = files_text(failures_) + " failed";
    if (files_.empty())
        throw failure(first_failure_->code, failed + ", the first because " + first_failure_->why,
                      first_failure_->advice);
    throw failure(exit_code::partly_done, sentence() + ", but " + failed,
                  "the messages above say why; what is done is not done again");
}

void transfer_report::tell(results &output) const
{
    const bool only_one = kind_ == batch::one && files_.size() == 1;
    output.sentence(only_one ? sentence_for(files_.front()) : capitalized(sentence()), facts());
}

// "uploaded 3 files (1.2 MiB), 2 files were up to date"
std::string transfer_report::sentence() const
{
    const std::size_t unchanged = count(outcome::unchanged);
    std::uint64_t bytes = 0;
    for (const transferred &each : files_)
        if (each.how != outcome::unchanged)
            bytes += each.size;
    std::string text =
        verb_ + (" " + files_text(files_.size() - unchanged)) + " (" + size_text(bytes) + ")";
    if (unchanged > 0)
        text += ", " + files_text(unchanged) + (unchanged == 1 ? " was" : " were") + " up to date";
    return text;
}

std::vector<fact> transfer_report::facts() const
{
    auto files = nlohmann::ordered_json::array();
    for (const transferred &each : files_)
        files.push_back({{"outcome", word_for(each.how)},
                         {"source", each.source},
                         {"target", each.target},
                         {"key", each.key},
                         {"size", each.size}});
    return {{"files", nullptr, std::move(files)}};
}

std::size_t transfer_report::count(outcome how) const
{
    return static_cast<std::size_t>(std::count_if(
        files_.begin(), files_.end(), [how](const transferred &each) { return each.how == how; }));
}

} // namespace quillmere::tools
