// Files. Names are judged here, access is not: whoever calls has made sure that the account may do
// it. Changes belong inside a transaction.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "store/content.h"
#include "store/folders.h"

namespace emulator {

struct file {
    std::int64_t id = 0;
    std::string key;
    std::string link_key; // who knows it may fetch the bytes
    std::int64_t account = 0;
    std::int64_t folder = 0;
    std::string name;
    std::string description;
    std::string tags;
    std::string privacy;
    std::int64_t created = 0;
    std::int64_t modified = 0;
    content_id content;
    std::uint64_t downloads = 0;
    std::int64_t deleted = 0; // when; 0 while it lives
};

/** Deleted ones are found too. */
std::optional<file> find_file(database &store, std::string_view key);
std::optional<file> find_file_by_link(database &store, std::string_view link_key);
file file_of_id(database &store, std::int64_t id);
/** The living file of this name. */
std::optional<file> find_file_in(database &store, std::int64_t folder, std::string_view name);
/** The living files inside, in the order in which they were made. */
std::vector<file> files_in(database &store, std::int64_t folder);

struct new_file {
    std::string name;
    std::int64_t now;
    std::int64_t modified;
};

/** Makes an entry without content. Throws a refusal when the name is taken. Privacy comes from the
 * folder. */
file create_file(database &store, const folder &in, const new_file &made);
/** Throws a refusal when the storage of the account does not suffice. */
void put_content(database &store, const file &target, const content_id &content,
                 std::int64_t modified);
void update_file(database &store, const file &target, const metadata_change &change);
void delete_file(database &store, const file &target, std::int64_t now);
void move_file(database &store, const file &source, const folder &destination);
/** A taken name gets a number. Returns the copy. */
file copy_file(database &store, const file &source, const folder &destination, std::int64_t now);
/** The same without judging anything or telling the feed: for whoever copies whole trees. */
file copy_file_row(database &store, const file &source, const folder &into, const std::string &name,
                   std::int64_t now);
void count_download(database &store, const file &target);

} // namespace emulator
