// A folder of a test's own, gone when the test ends.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <system_error>

class scratch_directory {
public:
    scratch_directory()
    {
        std::string name = (std::filesystem::temp_directory_path() / "emulator-XXXXXX").string();
        if (!::mkdtemp(name.data()))
            throw std::runtime_error("no scratch directory");
        path_ = name;
    }
    ~scratch_directory()
    {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }
    scratch_directory(const scratch_directory &) = delete;
    scratch_directory &operator=(const scratch_directory &) = delete;

    const std::filesystem::path &path() const { return path_; }

private:
    std::filesystem::path path_;
};
