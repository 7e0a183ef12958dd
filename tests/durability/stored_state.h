// What is on the disk while no server runs.
#pragma once

#include <filesystem>
#include <map>
#include <string>

#include "emulator/random_changes.h"

/** In place of the hash of a file that has not got any bytes yet. */
constexpr const char *no_content = "none";

/**
 * An entry as these tests compare it.
 *
 * @param content the hash of a file's bytes, or no_content; empty for a folder
 */
account_entry stored_entry(const std::string &kind, const std::string &parent,
                           const std::string &name, const std::string &content);

/** SHA-256, in hexadecimal digits. */
std::string hash_of(const std::string &bytes);

struct stored_account {
    std::string root;
    entries tree;
    std::uint64_t revision;
    std::uint64_t newest_in_feed; // 0 for a feed without entries
};

/** All accounts of a data folder, by their address. */
std::map<std::string, stored_account> stored_accounts(const std::filesystem::path &data);

/** What SQLite finds wrong with the store; empty when nothing is. */
std::string damage_of_store(const std::filesystem::path &data);

/** The contents that the store refers to and that are not there, whole and unchanged. */
std::string damaged_contents(const std::filesystem::path &data);
