// The view of a string buffer that may be logged.
#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

#include "owned.h"
#include "runtime/memory.h"
#include "text/string_buffer.h"

namespace quillmere {

namespace {

// Where the longest of the ranges that start at a byte ends, for every byte; 0 where none starts.
// So the cost is that of the text plus that of the ranges, whatever their order and however much
// they overlap.
using end_table = std::unique_ptr<int32_t, releaser<free_memory>>;

void add_range(int32_t *ends, uint64_t length, const redaction_range &range)
{
    // Indices count as signed 32-bit numbers, deliberately: a range that ends at -1 hides nothing.
    auto start = static_cast<int32_t>(range.start);
    auto end = static_cast<int32_t>(range.end);
    if (start > end)
        std::swap(start, end);
    auto first = static_cast<uint64_t>(static_cast<int64_t>(start));
    if (first >= length || start == end)
        return;
    ends[first] = std::max(ends[first], end);
}

end_table ends_of(const string_buffer &buffer)
{
    if (buffer.length >= UINT64_MAX / sizeof(int32_t))
        out_of_memory();
    end_table ends(static_cast<int32_t *>(allocate_zeroed((buffer.length + 1) * sizeof(int32_t))));
    for (const redaction_range *range = buffer.redaction_ranges; range; range = range->next)
        add_range(ends.get(), buffer.length, *range);
    return ends;
}

// Behind the last byte that is hidden by the ranges at start and by all that overlap or touch.
uint64_t end_of_run(const int32_t *ends, uint64_t length, uint64_t start)
{
    auto end = static_cast<uint64_t>(ends[start]);
    for (uint64_t index = start + 1; index <= end && index < length; ++index)
        end = std::max(end, static_cast<uint64_t>(ends[index]));
    return std::min(end, length);
}

owned_buffer redacted(const string_buffer &buffer, const char *marker)
{
    uint64_t length = buffer.length;
    uint64_t marker_length = std::strlen(marker);
    end_table ends = ends_of(buffer);
    owned_buffer view(string_new(length + 1));

    uint64_t shown = 0; // all before it is in the view
    for (uint64_t index = 0; index < length; ++index) {
        if (ends.get()[index] == 0)
            continue;
        string_append_len(view.get(), buffer.bytes + shown, index - shown);
        string_append_len(view.get(), marker, marker_length);
        shown = end_of_run(ends.get(), length, index);
        index = shown; // where no range starts, or the run would go on
    }
    if (shown < length)
        string_append_len(view.get(), buffer.bytes + shown, length - shown);
    return view;
}

} // namespace

} // namespace quillmere

using namespace quillmere;

const char *string_get_obfs(string_buffer *buffer, const char *replacement)
{
    if (!buffer->redaction_ranges)
        return buffer->bytes;

    std::free(std::exchange(buffer->redacted_copy, nullptr));
    owned_buffer view = redacted(*buffer, replacement ? replacement : "(omitted)");
    buffer->redacted_copy = std::exchange(view->bytes, nullptr);
    return buffer->redacted_copy;
}
