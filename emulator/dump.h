// What the store holds, for people and for tests to look at.
#pragma once

#include <string>

namespace emulator {

class database;

/** All accounts, trees and feeds as JSON, indented. No secret is in it: neither passwords nor
 * tokens, nor the keys of links or applications. */
std::string dump(database &store);

} // namespace emulator
