// Back to the beginning, for the next test.
#pragma once

#include <cstdint>

namespace emulator {

class content_store;
class database;

/**
 * Empties every account: no entries, revision 1, nothing used, and the next epoch, which tells
 * clients to begin again. Accounts with their profiles, applications and sessions stay.
 */
void reset_trees(database &store, content_store &content);

} // namespace emulator
