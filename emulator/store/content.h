// The bytes of files, kept once however many files hold them: each below the data folder under the
// name of its SHA-256. The bytes are on the disk, whole, before any file refers to them.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <set>
#include <string>
#include <string_view>

#include "digest.h"
#include "files.h"

namespace emulator {

/** Names some bytes. An entry that never got any has an empty hash. */
struct content_id {
    std::string hash; // SHA-256, 64 lower-case hexadecimal digits
    std::uint64_t size = 0;

    bool is_missing() const { return hash.empty(); }
};

/** Bytes on their way into the store. They are dropped unless they are kept. */
class incoming_content {
public:
    /** @param folder of the store; throws when nothing can be written there */
    explicit incoming_content(const std::filesystem::path &folder);
    ~incoming_content();
    incoming_content(const incoming_content &) = delete;
    incoming_content &operator=(const incoming_content &) = delete;

    void add(std::string_view piece);
    std::uint64_t size() const { return size_; }
    /** Nothing can be added any more. On return the bytes are on the disk. */
    content_id finish();
    /** Puts what was finished in its place in the store. */
    void keep(const content_id &finished);

private:
    std::filesystem::path folder_;
    std::filesystem::path path_; // a name of its own until it is whole
    descriptor file_;
    sha256_sum sum_;
    std::uint64_t size_ = 0;
};

class content_store {
public:
    /** Makes the folder on first use. */
    explicit content_store(std::filesystem::path directory);

    /** Reads to the end and keeps what it read. Throws for more bytes than that. */
    content_id keep(int descriptor, std::uint64_t largest) const;

    /** Begins with bytes that come piece by piece. */
    std::unique_ptr<incoming_content> receive() const;

    /** Throws when it is not there. */
    descriptor open(const content_id &content) const;

    bool holds(const content_id &content) const;

    /** Removes all but these. */
    void keep_only(const std::set<std::string> &hashes);

private:
    std::filesystem::path directory_;
};

} // namespace emulator
