// Elements by their names: found in one step, however many there are.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

#include "records/elements.h"

namespace quillmere {

// Of a few of the bytes alone: in the end, names are told apart by comparing them.
constexpr uint32_t hash_of(const char *text, size_t length)
{
    auto hash = static_cast<uint32_t>(length);
    if (length == 0)
        return hash;
    const size_t samples[] = {length - 1, length - 1 - length / 4, length / 2, 0};
    for (size_t at : samples)
        hash = hash * 31 + static_cast<unsigned char>(text[at]);
    return hash * 0x9e3779b1; // spreads over the high bits, which choose the bucket
}

// The name of an element, or its path below the root.
struct element_name {
    const char *text = nullptr;
    size_t length = 0;
    uint32_t hash = 0;

    constexpr element_name() = default;
    constexpr element_name(const char *name, size_t name_length)
        : text(name), length(name_length), hash(hash_of(name, name_length))
    {
    }
    constexpr explicit element_name(const char *name)
        : element_name(name, std::char_traits<char>::length(name))
    {
    }
};

struct element_row {
    element_name name;
    uint8_t next = 0; // row of the same bucket
};

// What an element_index looks like to those who do not know its size. Rows keep the order in which
// they were listed.
struct element_table {
    static constexpr uint8_t no_row = 255;

    const element_row *rows;
    const uint8_t *buckets;
    uint32_t bucket_shift;
    int32_t deepest_path; // the most elements in one, or 0 without any

    // The first row of this name, or no_row.
    uint8_t find(const element_name &name) const
    {
        return matching(buckets[name.hash >> bucket_shift], name);
    }

    // The next one of the same name, or no_row.
    uint8_t find_next(uint8_t row, const element_name &name) const
    {
        return matching(rows[row].next, name);
    }

private:
    uint8_t matching(uint8_t row, const element_name &name) const
    {
        while (row != no_row && !same(rows[row].name, name))
            row = rows[row].next;
        return row;
    }

    static bool same(const element_name &one, const element_name &other)
    {
        return one.hash == other.hash && one.length == other.length &&
               std::memcmp(one.text, other.text, one.length) == 0;
    }
};

constexpr const char *element_of(const char *element) { return element; }
template <class Record> constexpr const char *element_of(const element_field<Record> &row)
{
    return row.element;
}

// Longer paths, and an empty name, are not indexed: they are found in no table.
constexpr size_t longest_path = 64;

// Made by the compiler out of tables of names, or of names with their fields.
template <size_t count> class element_index {
    static_assert(count > 0 && count < element_table::no_row, "rows are counted in one byte");

public:
    template <class... Tables> constexpr explicit element_index(const Tables &...tables)
    {
        size_t row = 0;
        (list(tables, row), ...);
        for (uint8_t &bucket : buckets_)
            bucket = element_table::no_row;
        // From the last one on, so that the first row of a bucket is found first.
        while (row > 0)
            put_into_bucket(--row);
    }

    constexpr element_table table() const
    {
        return {rows_, buckets_, 32 - bucket_bits(), deepest_path_};
    }

private:
    // Twice as many buckets as rows, or up to four times.
    static constexpr uint32_t bucket_bits()
    {
        uint32_t bits = 1;
        while ((size_t{1} << bits) < 2 * count)
            ++bits;
        return bits;
    }

    template <class Table> constexpr void list(const Table &table, size_t &row)
    {
        for (const auto &entry : table)
            rows_[row++].name = element_name(element_of(entry));
    }

    constexpr void put_into_bucket(size_t row)
    {
        const element_name &name = rows_[row].name;
        int32_t depth = depth_of(name);
        if (name.length == 0 || (depth > 0 && name.length > longest_path)) {
            rows_[row].name = {}; // so that nobody takes it for one that is found
            return;
        }
        uint8_t &bucket = buckets_[name.hash >> (32 - bucket_bits())];
        rows_[row].next = bucket;
        bucket = static_cast<uint8_t>(row);
        if (depth > deepest_path_)
            deepest_path_ = depth;
    }

    // No element's name has a slash in it.
    static constexpr int32_t depth_of(const element_name &name)
    {
        int32_t depth = 0;
        for (size_t at = 0; at < name.length; ++at)
            depth += name.text[at] == '/' ? 1 : 0;
        return depth;
    }

    element_row rows_[count] = {};
    uint8_t buckets_[size_t{1} << bucket_bits()] = {};
    int32_t deepest_path_ = 0;
};

template <class... Rows, size_t... counts>
constexpr element_index<(counts + ...)> index_of(const Rows (&...tables)[counts])
{
    return element_index<(counts + ...)>(tables...);
}

} // namespace quillmere
