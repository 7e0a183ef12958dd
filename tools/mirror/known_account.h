// What a mirror knows of the account: the entries below the mirrored folder, as of a revision of
// the change feed.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "../remote_path.h"
#include "../transfers/partial_file.h"

namespace quillmere::tools {

struct known_entry {
    entry_kind kind = entry_kind::folder;
    std::string parent; ///< key; empty for the mirrored folder itself
    std::string name;
    expected_content content; ///< of a file
    bool described = false;   ///< name and content are as fresh as the place
    bool listed = false;      ///< of a folder: what it holds is known

    bool is_folder() const { return kind == entry_kind::folder; }
};

/** What the feed tells of an entry. */
struct entry_change {
    std::string key;
    entry_kind kind = entry_kind::folder;
    bool deleted = false;
    std::string parent;
};

struct known_account {
    std::string root; ///< key of the mirrored folder
    std::uint64_t revision = 0;
    std::string epoch; ///< of the account's tree: another one when it was begun anew
    std::map<std::string, known_entry> entries; ///< by key, the mirrored folder among them

    /** Forgets the entries, to learn of them from listings. */
    void begin(std::uint64_t at_revision, std::string in_epoch);
    bool has_begun() const { return !entries.empty(); }

    /**
     * Takes in all that the feed tells up to a revision, not a part of it: only all of it together
     * tells where everything is. What has left the mirrored folder is forgotten; what has come into
     * it is to be described, and listed.
     */
    void apply(const std::vector<entry_change> &changes, std::uint64_t up_to);

    /**
     * Takes in a folder's listing. A listing is younger than what is known, and the feed will tell
     * the same again; so what is known to be elsewhere stays there, since a place that is taken
     * from the one and places that are taken from the other might contradict each other.
     */
    void add_listing(const std::string &folder,
                     const std::vector<std::pair<std::string, known_entry>> &found);

    /** The keys of what is still to be described or listed. */
    std::vector<std::string> unfinished() const;

private:
    void forget_what_is_outside();
};

} // namespace quillmere::tools
