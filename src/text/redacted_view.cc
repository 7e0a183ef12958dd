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

// How many ranges cover each byte, kept as differences: the table holds +1 where a range starts and
// -1 where it ends. So the cost is that of the text plus that of the ranges, however much these
// overlap.
using cover_table = std::unique_ptr<int32_t, releaser<free_memory>>;

void add_range(int32_t *covers, uint64_t length, const redaction_range &range)
{
    // Indices count as signed 32-bit numbers, deliberately: a range that ends at -1 hides nothing.
    auto start = static_cast<int32_t>(range.start);
    auto end = static_cast<int32_t>(range.end);
    if (start > end)
        std::swap(start, end);
    auto first = static_cast<uint64_t>(static_cast<int64_t>(start));
    if (first >= length || start == end)
        return;
    auto last = static_cast<uint64_t>(end);
    covers[first] += 1;
    covers[last < length ? last : length] -= 1;
}

cover_table covers_of(const string_buffer &buffer)
{
    // One entry more than there are bytes, for the ranges that end with the text.
    uint64_t entries = buffer.length + 1;
    if (entries > UINT64_MAX / sizeof(int32_t))
        out_of_memory();
    cover_table covers(static_cast<int32_t *>(allocate_zeroed(entries * sizeof(int32_t))));
    for (const redaction_range *range = buffer.redaction_ranges; range; range = range->next)
        add_range(covers.get(), buffer.length, *range);
    return covers;
}

// Calls visit(index, hidden, first) for every byte; first tells a run's first hidden byte from the
// rest of it.
template <class Visitor> void walk(const int32_t *covers, uint64_t length, const Visitor &visit)
{
    int32_t depth = 0;
    bool hidden_before = false;
    for (uint64_t index = 0; index < length; ++index) {
        depth += covers[index];
        bool hidden = depth > 0;
        visit(index, hidden, hidden && !hidden_before);
        hidden_before = hidden;
    }
}

heap_text redacted(const string_buffer &buffer, const char *marker)
{
    cover_table covers = covers_of(buffer);
    uint64_t marker_length = std::strlen(marker);

    uint64_t length = 0;
    walk(covers.get(), buffer.length, [&](uint64_t, bool hidden, bool first) {
        length += first ? marker_length : (hidden ? 0 : 1);
    });

    heap_text view(static_cast<char *>(allocate_zeroed(length + 1)));
    char *out = view.get();
    walk(covers.get(), buffer.length, [&](uint64_t index, bool hidden, bool first) {
        if (first) {
            out = std::copy_n(marker, marker_length, out);
        } else if (!hidden) {
            *out++ = buffer.bytes[index];
        }
    });
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
    buffer->redacted_copy = redacted(*buffer, replacement ? replacement : "(omitted)").release();
    return buffer->redacted_copy;
}
