// The session between two runs of the program: which service, who, and the token that proves it.
#pragma once

#include <optional>
#include <string>

#include "environment.h"
#include "private_file.h"

namespace quillmere::tools {

struct session {
    std::string service; ///< base address of the service that gave the token
    std::string email;   ///< empty when another proof than a password was given
    std::string token;
};

/** $XDG_STATE_HOME/quillmere/session.json, or the same below ~/.local/state. */
std::string session_path(const environment &surroundings);

class session_file {
public:
    explicit session_file(std::string path, folder_owner folder = folder_owner::program)
        : path_(std::move(path)), folder_(folder)
    {
    }

    const std::string &path() const { return path_; }

    /**
     * The session, or nothing when nobody is signed in. A file that others could read is closed to
     * them, with a warning; one that is damaged or unsafe is a failure.
     */
    std::optional<session> load() const;

    /** Replaces the session as a whole. */
    void save(const session &current) const;

    /** Forgets the session, whatever the file holds; false when there was none. */
    bool remove() const;

private:
    std::string path_;
    folder_owner folder_;
};

} // namespace quillmere::tools
