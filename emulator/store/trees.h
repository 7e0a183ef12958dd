// What is done with a folder and all that it holds. Changes belong inside a transaction.
#pragma once

#include <cstdint>

#include "store/folders.h"

namespace emulator {

/** Deletes it with all that it holds; accounts that had attached any of it lose that. */
void delete_folder(database &store, const folder &target, std::int64_t now);

/** Throws a refusal for a move into itself, a taken name, or a tree too deep. */
void move_folder(database &store, const folder &source, const folder &destination);

/** As for a move, but a taken name gets a number. Returns the copy. */
folder copy_folder(database &store, const folder &source, const folder &destination,
                   std::int64_t now);

/** Throws a refusal when a tree of this many levels would reach too deep inside the folder. */
void check_depth(database &store, std::int64_t folder, std::int64_t levels);

/** Whether the folder is the other one or lies somewhere inside it. */
bool lies_within(database &store, std::int64_t folder, std::int64_t other);

struct tree_totals {
    std::uint64_t files = 0;
    std::uint64_t folders = 0;
    std::uint64_t size = 0;
};

/** All that lives in the folder, at any depth, whoever looks. */
tree_totals totals_of(database &store, std::int64_t folder);

} // namespace emulator
