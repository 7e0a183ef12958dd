// Text that must not stay in memory once it has been used: passwords and keys.
#pragma once

#include <array>
#include <cstring>
#include <memory>
#include <string_view>

namespace quillmere::tools {

/** NUL-terminated text in one place that never moves, wiped when its owner lets go of it. */
class secret_text {
public:
    static constexpr std::size_t longest = 4096;

    secret_text() : storage_(new storage) {}

    /** False when the text is as long as it may be; the letter is lost then. */
    bool append(char letter)
    {
        if (storage_->length == longest)
            return false;
        storage_->letters[storage_->length++] = letter;
        return true;
    }
    void cut_last() { storage_->letters[--storage_->length] = '\0'; }

    const char *c_str() const { return storage_->letters.data(); }
    std::string_view view() const { return {c_str(), storage_->length}; }
    bool empty() const { return storage_->length == 0; }

private:
    // Moving the owner moves the pointer alone, so that no copy is left behind.
    struct storage {
        std::array<char, longest + 1> letters = {};
        std::size_t length = 0;
    };
    struct wipe {
        void operator()(storage *used) const
        {
            ::explicit_bzero(used->letters.data(), used->letters.size());
            delete used;
        }
    };
    std::unique_ptr<storage, wipe> storage_;
};

} // namespace quillmere::tools
