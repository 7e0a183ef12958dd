// What a mirror did to the copy, told as it goes on where it matters, and as a whole in the end.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "../failure.h"
#include "layout.h"

namespace quillmere::tools {

class results;

enum class mirror_action { made, fetched, moved, removed, kept };

/** Whether a report tells what was done, or what would be. */
enum class mirror_tense { done, foreseen };

/** One thing that was done. Paths begin at the copy's top. */
struct mirror_step {
    mirror_action action = mirror_action::made;
    entry_kind kind = entry_kind::file;
    std::string key; ///< empty for what is no entry of the account
    std::string path;
    std::string former_path; ///< of what had another one
    std::uint64_t size = 0;  ///< of what was fetched
};

class mirror_report {
public:
    /** The two paths are for messages. */
    mirror_report(std::string remote_path, std::string local_path,
                  mirror_tense tense = mirror_tense::done)
        : remote_path_(std::move(remote_path)), local_path_(std::move(local_path)), tense_(tense)
    {
    }

    const std::string &remote_path() const { return remote_path_; }
    std::string local_path_of(const std::string &path) const;

    void add(mirror_step step);
    /** Something of the user's now stands beside its old path, or stays there. Told at once. */
    void keep(entry_kind kind, const std::string &path, const std::string &former_path);

    /** Takes a step. A failure that concerns one entry alone is told and counted, and the others go
     * on; any other is thrown, with what is done already. */
    void attempt(const std::function<void()> &step);
    void count_failure(const failure &problem);

    /** What no file here can be. Each is told once. */
    void leave_out(const std::vector<left_out_entry> &entries);

    /** Begins another round: failures are mended in it, or counted again. */
    void begin_round() { failures_ = 0; }
    std::size_t failures() const { return failures_; }
    bool is_empty() const { return steps_.empty(); }

    /** Tells what was done, and forgets it. */
    void tell(results &output, const known_account &account);
    /** Throws failure when the copy is not all that the account is. */
    void require_success() const;
    /** The same as a message, for a mirror that goes on. */
    void note_incomplete() const;

private:
    const char *either(const char *if_done, const char *if_foreseen) const
    {
        return tense_ == mirror_tense::done ? if_done : if_foreseen;
    }
    std::string sentence() const;
    std::string incompleteness() const;

    std::string remote_path_;
    std::string local_path_;
    mirror_tense tense_;
    std::vector<mirror_step> steps_;
    std::set<std::string> left_out_; // keys
    std::optional<failure> first_failure_;
    std::size_t failures_ = 0;
};

} // namespace quillmere::tools
