// The files that the whole process opens by name, libraries included: counted, refused, or looked
// for elsewhere.
#pragma once

#include <cstddef>
#include <map>
#include <string>

namespace quillmere_test {

// While it lives, the process's files go by its fields. One at a time; the fields are set while no
// other thread runs.
class watched_files {
public:
    watched_files();
    ~watched_files();
    watched_files(const watched_files &) = delete;
    watched_files &operator=(const watched_files &) = delete;

    std::string refused;   // a path that cannot be opened
    std::string folder;    // what is looked for in this folder
    std::string stands_in; // is looked for in this one

    size_t openings_of(const std::string &path) const;
};

} // namespace quillmere_test
