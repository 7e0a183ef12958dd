// Uploads of an account: files that are new, and files that get a new revision.
#pragma once

#include <string>

#include "../command.h"
#include "local_source.h"
#include "progress.h"
#include "remote_file.h"
#include "report.h"
#include "upload_route.h"

namespace quillmere::tools {

class uploader {
public:
    /** Says so when uploads go unencrypted. The account outlives it. */
    uploader(const account &owner, const settings &chosen, bool quiet);

    /** Puts a file into a folder: as a new one, or as a new revision of the one of that name. What
     * is there already is not sent. */
    transferred put(const local_source &from, remote_folder &into, const std::string &name);

    /** Makes it a new revision of a file. */
    transferred revise(const local_source &from, const remote_file &to, const std::string &path);

private:
    std::string send(const local_source &from, const std::string &url, const std::string &name);

    const account &owner_;
    const settings &chosen_;
    upload_route route_;
    progress_style style_;
};

} // namespace quillmere::tools
