#include "store/content.h"

#include <array>
#include <cerrno>
#include <stdexcept>
#include <system_error>
#include <utility>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "digest.h"

namespace emulator {
namespace {

constexpr std::size_t piece_bytes = 64 * 1024;

[[noreturn]] void fail(const std::string &what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

void flush(int number, const std::string &name)
{
    if (::fsync(number) != 0)
        fail(name);
}

// A new name is on the disk once its folder is.
void flush_folder(const std::filesystem::path &folder)
{
    const descriptor opened(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (opened.number() < 0)
        fail(folder.string());
    flush(opened.number(), folder.string());
}

void make_folder(const std::filesystem::path &folder)
{
    if (::mkdir(folder.c_str(), S_IRWXU) == 0)
        flush_folder(folder.parent_path());
    else if (errno != EEXIST)
        fail(folder.string());
}

/** A file under a name of its own until it is whole. What a killed process leaves of it is no
 * content, and goes with the next clearing. */
class temporary_file {
public:
    explicit temporary_file(const std::filesystem::path &folder)
        : path_(folder / ("new-" + random_hex(16))),
          file_(::open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, S_IRUSR | S_IWUSR))
    {
        if (file_.number() < 0)
            fail(path_.string());
    }
    ~temporary_file() { ::unlink(path_.c_str()); } // fails, as it should, once it is renamed
    temporary_file(const temporary_file &) = delete;
    temporary_file &operator=(const temporary_file &) = delete;

    int number() const { return file_.number(); }

    /** Puts it in place, whole or not at all. It may replace the same bytes: one name, one
     * content. */
    void rename_to(const std::filesystem::path &path)
    {
        flush(file_.number(), path_.string());
        if (::rename(path_.c_str(), path.c_str()) != 0)
            fail(path.string());
        flush_folder(path.parent_path());
    }

private:
    std::filesystem::path path_;
    descriptor file_;
};

std::size_t read_piece(int from, std::array<char, piece_bytes> &piece)
{
    for (;;) {
        const ssize_t got = ::read(from, piece.data(), piece.size());
        if (got >= 0)
            return static_cast<std::size_t>(got);
        if (errno != EINTR)
            fail("read");
    }
}

} // namespace

content_store::content_store(std::filesystem::path directory) : directory_(std::move(directory))
{
    make_folder(directory_);
}

content_id content_store::keep(int from, std::uint64_t largest)
{
    temporary_file made(directory_);
    sha256_sum sum;
    content_id kept;
    std::array<char, piece_bytes> piece;
    while (const std::size_t got = read_piece(from, piece)) {
        kept.size += got;
        if (kept.size > largest)
            throw std::runtime_error("more than " + std::to_string(largest) + " bytes");
        sum.add({piece.data(), got});
        write_all(made.number(), {piece.data(), got});
    }
    kept.hash = sum.finish_hex();
    make_folder(path_of(kept.hash).parent_path());
    made.rename_to(path_of(kept.hash));
    return kept;
}

descriptor content_store::open(const content_id &content) const
{
    const std::filesystem::path path = path_of(content.hash);
    descriptor opened(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (opened.number() < 0)
        fail(path.string());
    return opened;
}

bool content_store::holds(const content_id &content) const
{
    return ::access(path_of(content.hash).c_str(), F_OK) == 0;
}

void content_store::keep_only(const std::set<std::string> &hashes)
{
    std::vector<std::filesystem::path> unused;
    for (const auto &each : std::filesystem::recursive_directory_iterator(directory_))
        if (!each.is_directory() && hashes.count(each.path().filename()) == 0)
            unused.push_back(each.path());
    for (const std::filesystem::path &each : unused)
        std::filesystem::remove(each);
}

// A level of folders keeps each of them small.
std::filesystem::path content_store::path_of(const std::string &hash) const
{
    return directory_ / hash.substr(0, 2) / hash;
}

} // namespace emulator
