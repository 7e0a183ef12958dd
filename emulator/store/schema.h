// The tables of the store, and the steps from each version of them to the next.
#pragma once

namespace emulator {

class database;

/**
 * Runs the steps that this store has not seen, each once and all in one transaction. Throws for a
 * store that a later version of the program has written.
 */
void bring_up_to_date(database &store);

} // namespace emulator
