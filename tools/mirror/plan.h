// What is to be done to the copy, so that it becomes what the account is.
#pragma once

#include <set>
#include <string>
#include <vector>

#include "layout.h"
#include "placement.h"

namespace quillmere::tools {

/** The keys of what is concerned, in the order in which the steps are taken. */
struct plan {
    std::vector<std::string> rescued;   ///< files set aside that were changed here meanwhile
    std::vector<std::string> let_go;    ///< files that were changed here: they are the user's now
    std::vector<std::string> set_aside; ///< what has to leave its place, to another one or for good
    std::vector<std::string> left;      ///< folders that are no longer wanted, innermost first
    std::vector<std::string> folders;   ///< to be made or put into place, outermost first
    std::vector<std::string> moved;     ///< files to be put into place
    std::vector<std::string> missing;   ///< files whose bytes are to be brought

    bool is_empty() const;
};

/**
 * Plans the way from what is here to what is wanted.
 *
 * What moves is set aside first, all of it, and put into place then: so no order of the moves can
 * be wrong, where entries trade their names or change sides with a folder that they were in.
 *
 * @param here    everything at the place where it really is
 * @param unknown keys of folders of which nobody knows what they hold: what is here of it stays
 */
plan make_plan(const layout &wanted, const placements &here, const std::set<std::string> &unknown);

} // namespace quillmere::tools
