#include "support/stdout_capture.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <iostream>

#include "support/failure.h"

namespace quillmere_test {
namespace {

void flush_standard_output()
{
    std::cout.flush();
    std::fflush(stdout);
}

} // namespace

stdout_capture::stdout_capture()
    : before_(::fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, 0)),
      file_(::memfd_create("stdout", MFD_CLOEXEC))
{
    require(before_ && file_, "standard output's stand-in");
    // What is still waiting belongs to the real standard output.
    flush_standard_output();
    require(::dup2(file_.number(), STDOUT_FILENO) == STDOUT_FILENO, "dup2");
}

stdout_capture::~stdout_capture()
{
    // A failure was reported on standard output, too.
    std::string lost = testing::Test::HasFailure() ? text() : std::string();
    flush_standard_output();
    ::dup2(before_.number(), STDOUT_FILENO);
    std::fwrite(lost.data(), 1, lost.size(), stdout);
}

std::string stdout_capture::text() const
{
    flush_standard_output();
    std::string text;
    std::array<char, 4096> piece;
    // The descriptor shares its position with the writers; reading must not move it.
    for (;;) {
        off_t position = static_cast<off_t>(text.size());
        ssize_t count = ::pread(file_.number(), piece.data(), piece.size(), position);
        require(count >= 0, "pread");
        if (count == 0)
            return text;
        text.append(piece.data(), static_cast<size_t>(count));
    }
}

} // namespace quillmere_test
