// One pass over a document compared with a pass for each question: the lookups and the extractors
// that the library exports.
#pragma once

#include <string>
#include <vector>

namespace quillmere_test {

constexpr size_t most_sought = 8;

// What differs, or nothing at all.
std::string one_pass_difference(const std::string &xml, const std::vector<std::string> &sought);

} // namespace quillmere_test
