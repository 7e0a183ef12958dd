// Replies of the service as large as they come, for the measurements.
#pragma once

#include <string>

namespace quillmere_bench {

std::string folder_record();           // 24 values, about 1 KB
std::string user_record();             // 39 values
std::string listing(unsigned entries); // about 608 bytes and 18 elements an entry
std::string change_feed(unsigned changes);

} // namespace quillmere_bench
