// The names of entries: which can be, which are taken, and which one a copy gets.
#pragma once

#include <cstdint>
#include <string>

namespace emulator {

class database;

/** Throws a refusal for a text that cannot name an entry: no disk could hold it. */
void check_name(const std::string &name, const char *parameter);

/** Whether a living entry of the folder, other than the one with this key, has the name. */
bool is_name_taken(database &store, std::int64_t folder, const std::string &name,
                   const std::string &except_key = {});

/** Throws a refusal in that case. */
void check_name_is_free(database &store, std::int64_t folder, const std::string &name,
                        const std::string &except_key = {});

/** The name, or, when it is taken in the folder, the same with a number before its extension. */
std::string free_name(database &store, std::int64_t folder, const std::string &name);

} // namespace emulator
