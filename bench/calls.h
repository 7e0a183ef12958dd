// The operations that are measured, each called once and its results released.
#pragma once

#include "quillmere.h"

namespace quillmere_bench {

// They end the program when the operation does not succeed: what failed must not pass for quick.
void call_folder_info();
void call_user_info();
void call_folder_content();
void call_device_changes();

// What call_folder_content() releases: the caller's.
file_list *listed_files();

} // namespace quillmere_bench
