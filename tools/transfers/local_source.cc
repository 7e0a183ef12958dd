#include "local_source.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>

#include "../failure.h"
#include "sha256.h"

namespace quillmere::tools {

namespace {

namespace fs = std::filesystem;

template <class Take> void take_all(int file, const std::string &path, const Take &take)
{
    if (!read_pieces(file, take))
        throw file_failure("cannot read " + path, errno);
}

// Without a name it is gone whenever the program ends.
descriptor unnamed_file()
{
    const char *const folder = std::getenv("TMPDIR");
    std::string path = (folder != nullptr && *folder != '\0' ? folder : "/tmp");
    path += "/quillmere-XXXXXX";
    descriptor file(::mkostemp(path.data(), O_CLOEXEC));
    if (!file)
        throw file_failure("cannot make a temporary file " + path, errno);
    ::unlink(path.c_str());
    return file;
}

} // namespace

local_source open_source(const std::string &path)
{
    // Not to wait for somebody to write to a pipe: it is refused below.
    descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK));
    struct stat facts = {};
    if (!file || ::fstat(file.number(), &facts) != 0)
        throw file_failure("cannot read " + path, errno);
    if (!S_ISREG(facts.st_mode))
        throw failure(exit_code::local_file, path + " is neither a file nor a folder",
                      "of a pipe, use - and feed it to standard input");
    local_source opened = {path, std::move(file), 0, {}};
    sha256_sum sum;
    take_all(opened.file.number(), path, [&](std::string_view piece) {
        sum.add(piece);
        opened.size += piece.size();
    });
    opened.digest = sum.finish();
    return opened;
}

local_source take_standard_input()
{
    local_source taken = {"standard input", unnamed_file(), 0, {}};
    sha256_sum sum;
    take_all(STDIN_FILENO, taken.path, [&](std::string_view piece) {
        if (!write_all(taken.file.number(), piece))
            throw file_failure("cannot keep standard input in a temporary file", errno);
        sum.add(piece);
        taken.size += piece.size();
    });
    taken.digest = sum.finish();
    return taken;
}

bool is_local_folder(const std::string &path)
{
    struct stat facts = {};
    return ::stat(path.c_str(), &facts) == 0 && S_ISDIR(facts.st_mode);
}

bool is_link(const std::string &path)
{
    struct stat facts = {};
    return ::lstat(path.c_str(), &facts) == 0 && S_ISLNK(facts.st_mode);
}

std::string name_of_source(const std::string &path)
{
    std::error_code problem;
    const fs::path whole = fs::absolute(path, problem).lexically_normal();
    const fs::path name = whole.has_filename() ? whole.filename() : whole.parent_path().filename();
    if (problem || name.empty())
        throw failure(exit_code::usage, path + " has no name to be uploaded under",
                      "give the name as the destination");
    return name;
}

std::vector<std::string> names_in_folder(const std::string &path)
{
    std::vector<std::string> names;
    std::error_code problem;
    fs::directory_iterator each(path, problem);
    for (; !problem && each != fs::directory_iterator(); each.increment(problem))
        names.push_back(each->path().filename());
    if (problem)
        throw file_failure("cannot read the folder " + path, problem.value());
    std::sort(names.begin(), names.end());
    return names;
}

} // namespace quillmere::tools
