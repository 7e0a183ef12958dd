// Content that comes from this machine's files into an account.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

namespace emulator {

class content_store;
class database;

/** Where loaded content goes, and when. */
struct loading {
    database &store;
    content_store &content;
    std::int64_t account;
    std::int64_t now;
};

/**
 * Puts the bytes of a descriptor, read to its end, under a path of the account such as
 * "/photos/2026/a.jpg": folders that are missing are made, a file that is there gets the new
 * content. Returns its quick key.
 */
std::string load_bytes(const loading &into, int from, const std::string &path);

/**
 * Puts a file there, or all that a folder holds: its folders become folders, its files files. What
 * is there already and not in the folder stays; a file with the same content is not touched. Throws
 * for what is neither file nor folder, before anything of the tree is seen by clients.
 */
void load_tree(const loading &into, const std::filesystem::path &from, const std::string &path);

} // namespace emulator
