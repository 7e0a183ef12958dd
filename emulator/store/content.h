// The bytes of files, kept once however many files hold them: each below the data folder under the
// name of its SHA-256. The bytes are on the disk, whole, before any file refers to them.
#pragma once

#include <cstdint>
#include <filesystem>
#include <set>
#include <string>

#include "files.h"

namespace emulator {

/** Names some bytes. An entry that never got any has an empty hash. */
struct content_id {
    std::string hash; // SHA-256, 64 lower-case hexadecimal digits
    std::uint64_t size = 0;

    bool is_missing() const { return hash.empty(); }
};

class content_store {
public:
    /** Makes the folder on first use. */
    explicit content_store(std::filesystem::path directory);

    /** Reads to the end and keeps what it read. Throws for more bytes than that. */
    content_id keep(int descriptor, std::uint64_t largest);

    /** Throws when it is not there. */
    descriptor open(const content_id &content) const;

    bool holds(const content_id &content) const;

    /** Removes all but these. */
    void keep_only(const std::set<std::string> &hashes);

private:
    std::filesystem::path path_of(const std::string &hash) const;

    std::filesystem::path directory_;
};

} // namespace emulator
