// Surroundings in which a program cannot write: each makes of a command one that runs it so. The
// exit status stays the program's.
#pragma once

#include <string>

#include "support/process.h"

namespace quillmere_test {

// No file may become longer, and writes past the limit fail, as on a disk that is full.
command with_longest_file(const command &what, size_t kibibytes);

// The folder is on a disk of its own, with what it held and with room for so many KiB more. What it
// holds in the end is in the folder "<folder>.after".
command with_full_folder(const command &what, const std::string &folder, size_t free_kibibytes = 0);
command with_read_only_folder(const command &what, const std::string &folder);

// Nobody reads its standard output any more.
command with_closed_pipe(const command &what);

command with_full_output(const command &what);

// Whether this system lets us have disks of our own.
bool may_have_disks();

} // namespace quillmere_test
