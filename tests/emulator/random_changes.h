// Accounts changed at random, and what a client that follows the change feed knows of them.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <random>
#include <string>
#include <utility>
#include <vector>

struct account_entry {
    std::string parent;
    std::string revision;
    std::map<std::string, std::string> info; // what its own description says

    bool operator==(const account_entry &other) const
    {
        return parent == other.parent && revision == other.revision && info == other.info;
    }
};
using entries = std::map<std::string, account_entry>;

/** What tells the two apart, one entry on a line; empty when nothing does. */
std::string difference(const entries &known, const entries &listed);

struct change_outcome {
    bool is_granted;
    std::string new_folder; // the keys of what it made, or empty
    std::string new_file;
};

/** Makes changes at random, for accounts that may attach each other's folders. The same seed makes
 * the same changes on every machine. */
class random_changes {
public:
    /** Does what the action's name says for this account, by whatever way the test takes. */
    using action = std::function<change_outcome(
        const std::string &who, const std::string &name,
        const std::vector<std::pair<std::string, std::string>> &given)>;

    random_changes(std::uint32_t seed, action act) : random_(seed), act_(std::move(act)) {}

    /** Chooses from these entries from now on. */
    void learn(const std::string &who, const entries &known);

    /** Returns whether it was granted: what is refused must change nothing. */
    bool change(const std::string &who, const std::string &other);

private:
    std::uint32_t below(std::uint32_t end);
    std::string one_of(const std::vector<std::string> &keys);
    std::string folder(const std::string &who) { return one_of(folders_[who]); }
    std::string file(const std::string &who) { return one_of(files_[who]); }
    bool tell(const std::string &who, const std::string &name,
              const std::vector<std::pair<std::string, std::string>> &given);

    std::mt19937 random_;
    action act_;
    std::map<std::string, std::vector<std::string>> folders_;
    std::map<std::string, std::vector<std::string>> files_;
};
