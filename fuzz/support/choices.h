// Reads an input as a sequence of decisions. What is missing at its end counts as zero, so that
// every input means something.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace quillmere_fuzz {

class choices {
public:
    explicit choices(std::string_view input) : left_(input) {}

    bool left() const { return !left_.empty(); }

    uint8_t byte()
    {
        if (left_.empty())
            return 0;
        auto first = static_cast<uint8_t>(left_.front());
        left_.remove_prefix(1);
        return first;
    }

    size_t below(size_t bound) { return byte() % bound; }

    bool yes() { return (byte() & 1) != 0; }

    // Of any size: most numbers that matter are small ones, a few are huge.
    uint64_t number()
    {
        uint64_t value = 0;
        for (size_t bytes = below(9); bytes > 0; --bytes)
            value = value << 8 | byte();
        return value;
    }

    std::string_view bytes(size_t count)
    {
        std::string_view taken = left_.substr(0, count);
        left_.remove_prefix(taken.size());
        return taken;
    }

    std::string_view rest() { return bytes(left_.size()); }

    // A text for a C interface, which cannot hold a NUL.
    std::string text()
    {
        std::string_view taken = bytes(byte());
        return std::string(taken.substr(0, taken.find('\0')));
    }

    std::string line()
    {
        std::string_view taken = left_.substr(0, left_.find('\n'));
        left_.remove_prefix(taken.size() < left_.size() ? taken.size() + 1 : taken.size());
        return std::string(taken.substr(0, taken.find('\0')));
    }

private:
    std::string_view left_;
};

} // namespace quillmere_fuzz
