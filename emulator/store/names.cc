#include "store/names.h"

#include <algorithm>

#include "errors.h"
#include "store/database.h"

namespace emulator {
namespace {

constexpr std::size_t longest_name = 255; // bytes, as on most disks

bool is_control(char byte) { return static_cast<unsigned char>(byte) < 0x20 || byte == 0x7F; }

// ".profile" is all stem: a name that only begins with a dot has no extension.
std::size_t extension_of(const std::string &name)
{
    const std::size_t dot = name.rfind('.');
    return dot == std::string::npos || dot == 0 ? name.size() : dot;
}

// Cut between characters, so that what is left is still UTF-8.
std::string shortened(std::string stem, std::size_t length)
{
    if (stem.size() <= length)
        return stem;
    while (length > 0 && (static_cast<unsigned char>(stem[length]) & 0xC0) == 0x80)
        --length;
    stem.resize(length);
    return stem;
}

std::string numbered(const std::string &name, int number)
{
    const std::size_t dot = extension_of(name);
    const std::string ending = " (" + std::to_string(number) + ")" + name.substr(dot);
    if (ending.size() >= longest_name) // an extension as long as a name can be
        return shortened(name, longest_name - 8) + " (" + std::to_string(number) + ")";
    return shortened(name.substr(0, dot), longest_name - ending.size()) + ending;
}

} // namespace

void check_name(const std::string &name, const char *parameter)
{
    const bool is_path_step = name == "." || name == "..";
    const bool has_bad_byte =
        name.find('/') != std::string::npos || std::any_of(name.begin(), name.end(), is_control);
    if (name.empty() || name.size() > longest_name || is_path_step || has_bad_byte)
        throw refusal(error::parameter_invalid, parameter);
}

bool is_name_taken(database &store, std::int64_t folder, const std::string &name,
                   const std::string &except_key)
{
    return store
        .prepare("SELECT 1 FROM folders WHERE parent = ?1 AND name = ?2 AND key != ?3"
                 " AND deleted IS NULL UNION ALL SELECT 1 FROM files"
                 " WHERE folder = ?1 AND name = ?2 AND key != ?3 AND deleted IS NULL")
        .bind(folder, std::string_view(name), std::string_view(except_key))
        .step();
}

void check_name_is_free(database &store, std::int64_t folder, const std::string &name,
                        const std::string &except_key)
{
    if (is_name_taken(store, folder, name, except_key))
        throw refusal(error::name_taken);
}

std::string free_name(database &store, std::int64_t folder, const std::string &name)
{
    std::string candidate = name;
    for (int number = 2; is_name_taken(store, folder, candidate); ++number)
        candidate = numbered(name, number);
    return candidate;
}

} // namespace emulator
