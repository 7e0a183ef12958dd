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

namespace emulator {
namespace {

constexpr std::size_t piece_bytes = 64 * 1024;

void flush(int number, const std::string &name)
{
    if (::fsync(number) != 0)
        fail_by_errno(name);
}

// A new name is on the disk once its folder is.
void flush_folder(const std::filesystem::path &folder)
{
    const descriptor opened(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (opened.number() < 0)
        fail_by_errno(folder.string());
    flush(opened.number(), folder.string());
}

void make_folder(const std::filesystem::path &folder)
{
    if (::mkdir(folder.c_str(), S_IRWXU) == 0)
        flush_folder(folder.parent_path());
    else if (errno != EEXIST)
        fail_by_errno(folder.string());
}

// A level of folders keeps each of them small.
std::filesystem::path path_of(const std::filesystem::path &folder, const std::string &hash)
{
    return folder / hash.substr(0, 2) / hash;
}

std::size_t read_piece(int from, std::array<char, piece_bytes> &piece)
{
    for (;;) {
        const ssize_t got = ::read(from, piece.data(), piece.size());
        if (got >= 0)
            return static_cast<std::size_t>(got);
        if (errno != EINTR)
            fail_by_errno("read");
    }
}

} // namespace

// What a killed process leaves under this name is no content, and goes with the next clearing.
incoming_content::incoming_content(const std::filesystem::path &folder)
    : folder_(folder), path_(folder / ("new-" + random_hex(16))),
      file_(::open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, S_IRUSR | S_IWUSR))
{
    if (file_.number() < 0)
        fail_by_errno(path_.string());
}

incoming_content::~incoming_content()
{
    ::unlink(path_.c_str()); // fails, as it should, once it is renamed
}

void incoming_content::add(std::string_view piece)
{
    sum_.add(piece);
    write_all(file_.number(), piece);
    size_ += piece.size();
}

content_id incoming_content::finish()
{
    flush(file_.number(), path_.string());
    return {sum_.finish_hex(), size_};
}

// It may replace the same bytes: one name, one content.
void incoming_content::keep(const content_id &finished)
{
    const std::filesystem::path place = path_of(folder_, finished.hash);
    make_folder(place.parent_path());
    if (::rename(path_.c_str(), place.c_str()) != 0)
        fail_by_errno(place.string());
    flush_folder(place.parent_path());
}

content_store::content_store(std::filesystem::path directory) : directory_(std::move(directory))
{
    make_folder(directory_);
}

std::unique_ptr<incoming_content> content_store::receive() const
{
    return std::make_unique<incoming_content>(directory_);
}

content_id content_store::keep(int from, std::uint64_t largest) const
{
    incoming_content incoming(directory_);
    std::array<char, piece_bytes> piece;
    while (const std::size_t got = read_piece(from, piece)) {
        incoming.add({piece.data(), got});
        if (incoming.size() > largest)
            throw std::runtime_error("more than " + std::to_string(largest) + " bytes");
    }
    content_id finished = incoming.finish();
    incoming.keep(finished);
    return finished;
}

descriptor content_store::open(const content_id &content) const
{
    const std::filesystem::path path = path_of(directory_, content.hash);
    descriptor opened(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (opened.number() < 0)
        fail_by_errno(path.string());
    return opened;
}

bool content_store::holds(const content_id &content) const
{
    return ::access(path_of(directory_, content.hash).c_str(), F_OK) == 0;
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

} // namespace emulator
