// What a command has transferred, and what of it failed.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "../failure.h"
#include "../results.h"

namespace quillmere::tools {

enum class outcome { created, revised, unchanged, downloaded };

/** One file that is now where it was to be. */
struct transferred {
    outcome how = outcome::created;
    std::string source;
    std::string target;
    std::string key; ///< its quick key
    std::uint64_t size = 0;
};

/** How many files a command may be about. A failure of the only one is that of the command. */
enum class batch { one, many };

class transfer_report {
public:
    /** @param verb what was done to the files ("uploaded") */
    transfer_report(batch kind, const char *verb) : kind_(kind), verb_(verb) {}

    void add(transferred file);

    /**
     * Takes a step that may transfer something. Of many files one that fails is told and counted,
     * and the others go on. When nothing more can succeed, as without a session or a network, the
     * failure is thrown, with what is done already.
     */
    void attempt(const std::function<void()> &step);

    /** Throws failure if something failed, with what was done all the same. */
    void require_success() const;

    /** Tells what was done. */
    void tell(results &output) const;

private:
    std::string sentence() const;
    std::vector<fact> facts() const;
    std::size_t count(outcome how) const;

    batch kind_;
    const char *verb_;
    std::vector<transferred> files_;
    std::optional<failure> first_failure_;
    std::size_t failures_ = 0;
};

} // namespace quillmere::tools
