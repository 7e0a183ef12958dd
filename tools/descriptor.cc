#include "descriptor.h"

#include <array>
#include <cerrno>
#include <vector>

#include <fcntl.h>

namespace quillmere::tools {
namespace {

// Like read(), but not ended by a signal.
ssize_t read_piece(int number, char *piece, std::size_t size)
{
    for (;;) {
        const ssize_t count = ::read(number, piece, size);
        if (count >= 0 || errno != EINTR)
            return count;
    }
}

} // namespace

bool write_all(int number, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(number, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR)
            continue;
        if (written < 0)
            return false;
        bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

bool read_all(int number, std::size_t limit, std::string &text)
{
    std::array<char, 4096> piece;
    for (;;) {
        const ssize_t count = read_piece(number, piece.data(), piece.size());
        if (count <= 0)
            return count == 0;
        text.append(piece.data(), static_cast<std::size_t>(count));
        if (text.size() > limit) {
            errno = EFBIG;
            return false;
        }
    }
}

bool read_pieces(int number, const std::function<void(std::string_view piece)> &take)
{
    std::vector<char> piece(256 * 1024);
    for (;;) {
        const ssize_t count = read_piece(number, piece.data(), piece.size());
        if (count <= 0)
            return count == 0;
        take({piece.data(), static_cast<std::size_t>(count)});
    }
}

void occupy_standard_descriptors()
{
    // open() takes the lowest free number, so each pass fills one gap until 3 is reached. For
    // reading only: results written to a standard output that was closed must fail, not vanish.
    int number = ::open("/dev/null", O_RDONLY);
    while (number >= 0 && number <= STDERR_FILENO)
        number = ::open("/dev/null", O_RDONLY);
    if (number > STDERR_FILENO)
        ::close(number);
}

} // namespace quillmere::tools
