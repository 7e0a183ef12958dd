#include "support/thread_log.h"

#include <stdio.h>

#include <utility>

#include "quillmere.h"
#include "support/failure.h"

namespace quillmere_test {
namespace {

thread_local std::string own_lines;

extern "C" {
static ssize_t keep_lines(void *, const char *bytes, size_t count)
{
    own_lines.append(bytes, count);
    return static_cast<ssize_t>(count);
}
}

} // namespace

thread_log::thread_log()
    : before_(output_file), stream_(::fopencookie(nullptr, "w", {nullptr, keep_lines, {}, {}}))
{
    require(stream_ != nullptr, "fopencookie");
    // Or one thread's flush would write what another has left in the buffer.
    require(std::setvbuf(stream_, nullptr, _IONBF, 0) == 0, "setvbuf");
    set_quillmere_output_file(stream_);
}

thread_log::~thread_log()
{
    set_quillmere_output_file(before_);
    std::fclose(stream_);
}

std::string thread_log::take() { return std::exchange(own_lines, std::string()); }

} // namespace quillmere_test
