#include "store/entry_keys.h"

#include <string_view>

#include "digest.h"

namespace emulator {
namespace {

// 32 characters, so that each takes five bits and none is likelier than another. Those that are
// mistaken for one another in print are left out.
constexpr std::string_view alphabet = "abcdefghijkmnpqrstuvwxyz23456789";
static_assert(alphabet.size() == 32);

std::string random_key(std::size_t length)
{
    std::string key = random_bytes(length);
    for (char &each : key)
        each = alphabet[static_cast<unsigned char>(each) % alphabet.size()];
    return key;
}

} // namespace

std::string new_folder_key() { return random_key(13); }

std::string new_quick_key() { return random_key(15); }

std::string new_link_key() { return random_key(32); }

} // namespace emulator
