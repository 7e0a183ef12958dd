#include "support/log_capture.h"

#include <stdio.h>

#include <cstdlib>

#include "quillmere.h"
#include "support/failure.h"

namespace quillmere_test {

log_capture::log_capture() : before_(output_file), stream_(::open_memstream(&bytes_, &length_))
{
    require(stream_ != nullptr, "open_memstream");
    set_quillmere_output_file(stream_);
}

log_capture::~log_capture()
{
    set_quillmere_output_file(before_);
    std::fclose(stream_);
    std::free(bytes_);
}

std::string log_capture::text() const { return whole_text().substr(start_); }

void log_capture::clear() { start_ = whole_text().size(); }

std::string log_capture::whole_text() const
{
    // The stream moves its memory when another thread writes, but not while it is locked.
    ::flockfile(stream_);
    std::fflush(stream_);
    std::string text(bytes_, length_);
    ::funlockfile(stream_);
    return text;
}

} // namespace quillmere_test
