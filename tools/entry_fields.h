// What a command tells of a folder or a file.
#pragma once

#include <vector>

#include <quillmere.h>

#include "results.h"

namespace quillmere::tools {

std::vector<fact> facts_of(const folder_info *record);
std::vector<fact> facts_of(const file_info *record);

} // namespace quillmere::tools
