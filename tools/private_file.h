// Small text files: ordinary ones that are read, and private ones that nobody else may see and that
// are replaced as a whole or not at all.
#pragma once

#include <optional>
#include <string>

namespace quillmere::tools {

/** No file that is read whole has a reason to be larger. */
constexpr std::size_t largest_small_file = std::size_t{16} << 20;

/** The contents of a file; what names it in a failure ("the configuration file"). */
std::string read_small_file(const std::string &path, const std::string &what);

enum class privacy { kept, repaired };

struct private_text {
    std::string text;
    privacy found; ///< repaired when others could read the file until now
};

/**
 * The contents of a private file, or nothing when there is none. One that others can read is closed
 * to them first; one that belongs to somebody else, or that others can write, is refused, since its
 * contents may be theirs.
 */
std::optional<private_text> read_private_file(const std::string &path, const std::string &what);

/** Whose the directory of a private file is. The program's own is kept from other users; the mode
 * of another is none of its business. */
enum class folder_owner { program, somebody };

/**
 * Replaces a private file, with mode 0600, in a directory that is made with mode 0700. After a
 * crash the old contents are there or the new ones, never a part.
 */
void write_private_file(const std::string &path, const std::string &text, const std::string &what,
                        folder_owner folder = folder_owner::program);

/** Makes a new file with mode 0600, in a directory that is there; a failure when there is a file of
 * that name already. */
void create_private_file(const std::string &path, const std::string &text, const std::string &what);

/** Removes a file; false when there was none. */
bool remove_file(const std::string &path, const std::string &what);

} // namespace quillmere::tools
