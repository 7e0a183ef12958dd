#include "text/string_buffer.h"

#include <cstdlib>
#include <cstring>

#include "runtime/memory.h"

namespace quillmere {

namespace {

uint64_t grown_capacity(uint64_t capacity, uint64_t needed)
{
    // Doubling keeps appends amortised constant. A first allocation is exact, and so is one past
    // doubling's reach.
    if (capacity > UINT64_MAX / 2)
        return needed;
    return needed > 2 * capacity ? needed : 2 * capacity;
}

} // namespace

char *extend(string_buffer *buffer, uint64_t count)
{
    if (count >= UINT64_MAX - buffer->length)
        out_of_memory();
    uint64_t needed = buffer->length + 1 + count;
    if (needed > buffer->capacity) {
        uint64_t capacity = grown_capacity(buffer->capacity, needed);
        buffer->bytes = static_cast<char *>(reallocate(buffer->bytes, capacity));
        buffer->capacity = capacity;
    }
    char *gap = buffer->bytes + buffer->length;
    buffer->length += count;
    buffer->bytes[buffer->length] = '\0';
    return gap;
}

} // namespace quillmere

using namespace quillmere;

string_buffer *string_new(uint64_t capacity)
{
    auto *buffer = allocate_zeroed<string_buffer>();
    if (capacity > 0) {
        buffer->bytes = static_cast<char *>(allocate(capacity));
        buffer->bytes[0] = '\0';
        buffer->capacity = capacity;
    }
    return buffer;
}

int64_t string_append_len(string_buffer *buffer, const char *bytes, uint64_t count)
{
    char *gap = extend(buffer, count);
    if (count > 0)
        std::memcpy(gap, bytes, count);
    return static_cast<int64_t>(buffer->length);
}

int64_t string_append(string_buffer *buffer, const char *text)
{
    if (!buffer || !text)
        return -1;
    return string_append_len(buffer, text, std::strlen(text));
}

int64_t string_append_obfs(string_buffer *buffer, const char *text)
{
    if (!buffer || !text)
        return -1;
    return string_append_len_obfs(buffer, text, std::strlen(text));
}

int64_t string_append_len_obfs(string_buffer *buffer, const char *bytes, uint64_t count)
{
    uint64_t start = buffer->length;
    int64_t length = string_append_len(buffer, bytes, count);
    string_add_obfs_range(buffer, start, static_cast<uint64_t>(length));
    return length;
}

int64_t string_append_urlencode_obfs(string_buffer *buffer, const char *text)
{
    uint64_t start = buffer->length;
    int64_t length = string_append_urlencode(buffer, text);
    // Also after a failure: such a range ends at -1, and the redacted view passes over it.
    string_add_obfs_range(buffer, start, static_cast<uint64_t>(length));
    return length;
}

void string_add_obfs_range(string_buffer *buffer, uint64_t start, uint64_t end)
{
    auto *added = allocate_zeroed<redaction_range>();
    added->start = start;
    added->end = end;

    redaction_range **tail = &buffer->redaction_ranges;
    while (*tail)
        tail = &(*tail)->next;
    *tail = added;
}

const char *string_get(const string_buffer *buffer) { return buffer->bytes; }

uint64_t string_get_size(const string_buffer *buffer) { return buffer->length; }

int64_t string_reduce(string_buffer *buffer, uint64_t count)
{
    buffer->length = count <= buffer->length ? buffer->length - count : 0;
    if (buffer->bytes)
        buffer->bytes[buffer->length] = '\0';
    return static_cast<int64_t>(buffer->length);
}

void string_delete(string_buffer *buffer, int32_t free_text)
{
    if (!buffer)
        return;
    for (redaction_range *range = buffer->redaction_ranges; range;) {
        redaction_range *next = range->next;
        std::free(range);
        range = next;
    }
    std::free(buffer->redacted_copy);
    if (free_text == 1)
        std::free(buffer->bytes);
    std::free(buffer);
}

char *string_dup(const char *text)
{
    if (!text)
        return nullptr;
    char *copy = try_copy_text(text);
    if (!copy)
        out_of_memory();
    return copy;
}
