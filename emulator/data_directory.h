// The folder in which the emulator keeps everything, and who may use it.
#pragma once

#include <filesystem>

#include "files.h"

namespace emulator {

/** Under XDG_STATE_HOME, or else under the home folder. Throws when neither is known. */
std::filesystem::path default_data_directory();

class data_directory {
public:
    /** Makes the folder, readable for its owner alone, unless it is there. */
    explicit data_directory(const std::filesystem::path &path);

    const std::filesystem::path &path() const { return path_; }
    std::filesystem::path store() const { return path_ / "store.sqlite"; }
    std::filesystem::path content() const { return path_ / "content"; }
    std::filesystem::path root_certificate() const { return path_ / "ca.pem"; }
    std::filesystem::path root_key() const { return path_ / "ca-key.pem"; }
    std::filesystem::path server_certificate() const { return path_ / "server.pem"; }
    std::filesystem::path server_key() const { return path_ / "server-key.pem"; }

    /**
     * Makes the caller the one server of this folder for as long as the result lives. Throws when
     * another server has it. The kernel drops the claim of a killed process.
     */
    descriptor claim() const;

private:
    std::filesystem::path path_;
};

} // namespace emulator
