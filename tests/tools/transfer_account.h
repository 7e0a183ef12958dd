// An account to put files into and to get them from.
#pragma once

#include <string>
#include <vector>

#include "emulator_account.h"
#include "some_content.h"

namespace quillmere_test {

/** The names in a folder in their order, those that are hidden too. */
std::vector<std::string> names_in(const std::string &folder);

class transfer_account : public emulator_account {
protected:
    /** Signed in, with an empty folder to download to. */
    transfer_account();

    /** Runs a command that must succeed. */
    outcome done(std::vector<std::string> arguments, const std::string &input = {}) const;

    /** What the service tells of a file's bytes. */
    std::string remote_sha256(const std::string &path) const;

    /** Writes a file to upload, and gives its path. */
    std::string local(const std::string &name, const std::string &bytes) const;

    /** The names of what is stored in the emulator's folder of contents. */
    std::vector<std::string> stored_contents() const;

    /** The names in the folder to download to, those that are hidden too. */
    std::vector<std::string> downloaded() const;

    std::string download_path(const std::string &name = {}) const
    {
        return home.folder().path_of("downloads/" + name);
    }
};

} // namespace quillmere_test
