// Learns what an account holds: from listings at first, then from the change feed.
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>

#include "../account.h"
#include "../failure.h"
#include "../folder_content.h"
#include "known_account.h"

namespace quillmere::tools {

class account_reader {
public:
    /**
     * @param keep called now and then, so that what was learned until then can be kept
     *
     * The account outlives it.
     */
    account_reader(const account &owner, std::function<void()> keep)
        : owner_(owner), keep_(std::move(keep))
    {
    }

    /**
     * Brings what is known up to date, or begins it. Where the feed does not reach back to it, or
     * the account's tree was begun anew, it begins with listings again.
     *
     * @return whether anything is new. Throws failure, also when the mirrored folder is gone.
     */
    bool update(known_account &known);

    /** What the service refused to tell of entries, by their keys, when they were last asked for.
     */
    const std::map<std::string, failure> &refusals() const { return refusals_; }

private:
    struct news {
        std::vector<entry_change> changes;
        std::uint64_t revision = 0;
    };

    void begin(known_account &known);
    std::optional<news> read_news(const known_account &known);
    bool take_in_news(known_account &known);
    void fill(known_account &known);
    std::vector<std::string> next_unfinished(const known_account &known) const;
    void finish(known_account &known, const std::string &key);
    void describe(const std::string &key, known_entry &entry);
    void list(known_account &known, const std::string &key);
    folder_content steady_content(const remote_entry &folder);
    std::uint64_t device_revision();
    std::string epoch();
    void keep_now_and_then(const known_account &known);

    const account &owner_;
    std::function<void()> keep_;
    std::map<std::string, failure> refusals_;
    std::uint64_t seen_revision_ = 0;
    std::size_t steps_ = 0; ///< since it was last kept
};

} // namespace quillmere::tools
