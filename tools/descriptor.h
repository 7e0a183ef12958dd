// An owned file descriptor, and the few system calls on one that every user wants made whole: a
// write that is not cut short, a read that ends at a limit.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <utility>

#include <unistd.h>

namespace quillmere::tools {

class descriptor {
public:
    descriptor() = default;
    explicit descriptor(int number) : number_(number) {}
    descriptor(descriptor &&other) noexcept : number_(std::exchange(other.number_, -1)) {}
    descriptor &operator=(descriptor &&other) noexcept
    {
        std::swap(number_, other.number_);
        return *this;
    }
    ~descriptor()
    {
        if (number_ >= 0)
            ::close(number_);
    }

    int number() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }

private:
    int number_ = -1;
};

/** Writes all of the bytes; false with errno set when the system took only some of them. */
bool write_all(int number, std::string_view bytes);

/**
 * Appends what can be read, up to the end or to limit bytes; false with errno set after a failure.
 * More than limit bytes count as a failure with EFBIG.
 */
bool read_all(int number, std::size_t limit, std::string &text);

/** Hands on all that can be read, piece by piece; false with errno set after a failure. */
bool read_pieces(int number, const std::function<void(std::string_view piece)> &take);

/** Points the closed ones of descriptors 0, 1 and 2 at /dev/null, so that no file of ours becomes
 * one of them by accident. */
void occupy_standard_descriptors();

} // namespace quillmere::tools
