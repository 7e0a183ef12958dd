// Downloads of an account: files, and folders with all that they hold.
#pragma once

#include <string>
#include <vector>

#include "../command.h"
#include "linked_content.h"
#include "local_folder.h"
#include "remote_file.h"
#include "report.h"

namespace quillmere::tools {

class fetcher {
public:
    /** The account and the report outlive it. */
    fetcher(const account &owner, const settings &chosen, link_security security,
            progress_style style, transfer_report &report);

    /** Brings a file into a folder under a name. What is there already is not fetched. */
    void get_file(const remote_file &file, const std::string &path, const local_folder &into,
                  const std::string &name);

    /** Brings all that a folder holds into another, as far as it can. */
    void get_folder(const remote_entry &folder, const std::string &path, const local_folder &into);

private:
    struct wanted {
        remote_file file;
        std::string path; ///< in the account
        std::string name; ///< in the local folder
    };
    bool is_there(const wanted &each, const local_folder &into);
    void get_all(const std::vector<wanted> &files, const local_folder &into);
    void get(const wanted &each, const local_folder &into);

    const account &owner_;
    transfer_report &report_;
    linked_content contents_;
};

} // namespace quillmere::tools
