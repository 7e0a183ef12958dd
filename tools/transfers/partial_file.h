// A download on its way: a file under a name of its own until it is whole. What is there of it may
// be gone on with, by another run of the program too.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "../descriptor.h"
#include "sha256.h"

namespace quillmere::tools {

/** The bytes that a download is to bring. */
struct expected_content {
    std::uint64_t size = 0;
    std::string sha256; ///< hexadecimal, lower case
};

class partial_file {
public:
    /**
     * Opens the beginning that an earlier download of the same bytes left in the folder, or makes
     * a new file.
     *
     * @param folder an open directory, which outlives the object
     *
     * Throws failure, also when another process is at it.
     */
    partial_file(int folder, const expected_content &expected);
    partial_file(const partial_file &) = delete;
    partial_file &operator=(const partial_file &) = delete;
    /** Removes it if nothing is in it. */
    ~partial_file();

    std::uint64_t size() const { return size_; }
    std::uint64_t missing() const { return expected_.size - size_; }
    void append(std::string_view piece);
    /** Drops what is there. */
    void restart();
    /** Whether it has the size and the digest that were expected. Nothing is appended afterwards,
     * unless it is restarted. */
    bool is_right();
    /** Gives it its name, in the place of a file that has it. */
    void rename_to(const std::string &name);
    /** Sees to it that a power cut does not take the bytes back. */
    void flush();
    const std::string &name() const { return name_; }
    /** Told when somebody else has given it its name: there is nothing to remove then. */
    void left() { in_place_ = true; }

    /** The name under which the beginning of these bytes is kept. */
    static std::string name_for(const expected_content &expected);

private:
    bool open();
    void take_in_what_is_there();

    int folder_;
    expected_content expected_;
    std::string name_;
    descriptor file_;
    sha256_sum sum_;
    std::uint64_t size_ = 0;
    bool in_place_ = false;
};

} // namespace quillmere::tools
