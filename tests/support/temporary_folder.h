// A folder of a test's own, gone with everything in it when the test ends.
#pragma once

#include <string>
#include <string_view>

#include <sys/types.h>

namespace quillmere_test {

class temporary_folder {
public:
    temporary_folder();
    ~temporary_folder();
    temporary_folder(const temporary_folder &) = delete;
    temporary_folder &operator=(const temporary_folder &) = delete;

    const std::string &path() const { return path_; }

    // The path that a file of this name has, or would have, in the folder.
    std::string path_of(const std::string &name) const { return path_ + "/" + name; }

    // Writes a file, readable by its owner alone, and returns its path.
    std::string write(const std::string &name, std::string_view content) const;

private:
    std::string path_;
    pid_t owner_;
};

// The whole content of a file.
std::string content_of(const std::string &path);

} // namespace quillmere_test
