// The keys by which the service names entries and links: random, so that none can be guessed.
#pragma once

#include <string>

namespace emulator {

/** 13 lower-case letters and digits. */
std::string new_folder_key();
/** 15 lower-case letters and digits. */
std::string new_quick_key();
/** 32 of them: who knows such a key may fetch the bytes. */
std::string new_link_key();

} // namespace emulator
