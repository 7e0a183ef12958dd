// What a folder shows to an account: its own folders, those attached there, its files.
#pragma once

#include <cstdint>
#include <vector>

#include "store/file_entries.h"
#include "store/folders.h"

namespace emulator {

/** Which folder, and who looks: 0 for somebody who sees only what is public. */
struct listing {
    std::int64_t folder;
    std::int64_t viewer;
};

/** A part of a listing; entries come in the order in which they were made, new ones last. */
struct listing_part {
    std::int64_t first; // counted from 0
    std::int64_t count;
};

std::uint64_t count_folders(database &store, listing of);
std::uint64_t count_files(database &store, listing of);
std::vector<folder> list_folders(database &store, listing of, listing_part part);
std::vector<file> list_files(database &store, listing of, listing_part part);

/** The bytes of the files directly inside. */
std::uint64_t size_of_files(database &store, listing of);

} // namespace emulator
