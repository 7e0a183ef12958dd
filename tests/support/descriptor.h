// One owner for every file descriptor that the tests hold.
#pragma once

#include <unistd.h>

#include <utility>

namespace quillmere_test {

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
    ~descriptor() { reset(); }

    int number() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }

    void reset()
    {
        if (number_ >= 0)
            ::close(std::exchange(number_, -1));
    }

private:
    int number_ = -1;
};

} // namespace quillmere_test
