// What the interface demands whatever the library does: blocks of the heap for records and their
// texts, and log lines that are written at once. Measured alone, it explains what a call costs
// beyond the exchange and the parsing.
#pragma once

#include "quillmere.h"

namespace quillmere_bench {

// Makes the records of a reply, texts and all, out of constants, and deletes them.
void make_folder_record();
void make_user_record();
void make_listing();     // of 1,000 files
void make_change_list(); // of 500 changes

// The lines of one operation: three, each written out at once.
void log_lines(const char *reply);

// A list of records of its own with the same texts.
file_list *copy_of(const file_list *files);

} // namespace quillmere_bench
