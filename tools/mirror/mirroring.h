// A mirror at work: what it knows is brought up to date, the copy is made to agree with it, and
// both are kept on the way, so that a run that is killed is gone on with by the next.
#pragma once

#include <memory>

#include "account_reader.h"
#include "applier.h"
#include "local_copy.h"
#include "report.h"
#include "state.h"

namespace quillmere::tools {

class mirroring {
public:
    /**
     * @param root key of the mirrored folder; a failure when the copy is one of another
     *
     * All others outlive it.
     */
    mirroring(const account &owner, const std::string &root, const local_copy &copy,
              linked_content &contents, mirror_report &report);

    /** Makes the copy what the account is now. What fails is tried again when there are news that
     * may explain it. Always true. */
    bool run();

    /** The same, if there is anything to do; true then. */
    bool run_if_new();

    /** Reports the steps of a run. Of a copy to look at, with which nothing else is to be done. */
    void foresee();

    const known_account &known() const { return state_.account; }

private:
    static mirror_state loaded_state(const local_copy &copy, const std::string &root);
    bool learn();
    void agree();
    std::unique_ptr<disk> disk_to_change() const;
    void keep();

    const local_copy &copy_;
    linked_content &contents_;
    mirror_report &report_;
    mirror_state state_;
    account_reader reader_;
    bool behind_ = true; ///< the copy is not yet what is known
};

} // namespace quillmere::tools
