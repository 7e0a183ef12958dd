// Tries the inputs that are kept, as an ordinary test: replay TARGET FOLDER
#include <cstdio>
#include <cstring>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

#include "support/target.h"

namespace {

using quillmere_fuzz::target;

const target *find_target(const char *name)
{
    for (const target &each : quillmere_fuzz::known_targets())
        if (std::strcmp(each.name, name) == 0)
            return &each;
    return nullptr;
}

std::string bytes_of(const std::filesystem::path &file)
{
    std::ifstream in(file, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

std::vector<std::filesystem::path> files_in(const char *folder)
{
    std::vector<std::filesystem::path> files;
    for (const auto &each : std::filesystem::directory_iterator(folder))
        files.push_back(each.path());
    std::sort(files.begin(), files.end());
    return files;
}

} // namespace

int main(int argc, char **argv)
{
    const target *chosen = argc == 3 ? find_target(argv[1]) : nullptr;
    if (!chosen) {
        std::fprintf(stderr, "usage: replay TARGET FOLDER\n");
        return 2;
    }
    auto files = files_in(argv[2]);
    for (const auto &each : files) {
        // The last line of a failed run names the input.
        std::printf("%s\n", each.c_str());
        std::fflush(stdout);
        chosen->try_input(bytes_of(each));
    }
    chosen->try_input({});
    return files.empty() ? 1 : 0;
}
