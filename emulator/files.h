// Files that must never be seen half written.
#pragma once

#include <filesystem>
#include <string>
#include <string_view>

#include <sys/types.h>

namespace emulator {

/** A file descriptor, closed at the end. */
class descriptor {
public:
    explicit descriptor(int number) : number_(number) {}
    ~descriptor();
    descriptor(descriptor &&other) noexcept : number_(other.number_) { other.number_ = -1; }
    descriptor &operator=(descriptor &&) = delete;

    int number() const { return number_; }

private:
    int number_;
};

/** Throws std::system_error, with what errno says. */
[[noreturn]] void fail_by_errno(const std::string &what);

/** Writes all of it or throws std::system_error. */
void write_all(int descriptor, std::string_view text);

/** Replaces the file at once, by a rename; on return its content is on the disk. */
void write_file(const std::filesystem::path &path, std::string_view text, mode_t mode);

/** The whole content. Throws std::system_error, also for a file above the limit. */
std::string read_file(const std::filesystem::path &path, std::size_t largest);
std::string read_descriptor(int descriptor, std::size_t largest);

} // namespace emulator
