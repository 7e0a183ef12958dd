#include "request_counts.h"

#include "links.h"
#include "router.h"
#include "uploads.h"

namespace emulator {
namespace {

// Paths are the client's, and endless: only those that mean something get a count of their own.
std::string counted_as(std::string_view path)
{
    if (path == upload_path || is_endpoint(path))
        return std::string(path);
    const link_kind *kind = link_kind_of(path);
    return kind ? kind->folder : "other";
}

} // namespace

void request_counts::count(std::string_view path)
{
    ++total_;
    ++counts_[counted_as(path)];
}

} // namespace emulator
