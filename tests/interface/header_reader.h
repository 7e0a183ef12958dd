// Reads the public header as text: what it declares, and what it says about each declaration.
#pragma once

#include <string>
#include <vector>

namespace quillmere_test {

struct declaration {
    std::string name;
    std::string text;    // without comments, up to and with the semicolon
    std::string comment; // the documentation of it or of the family it stands in; empty if none
};

// Every declaration marked QM_API, in order. Lines that belong together without an empty line
// between them share the comment above; so do the functions of a record and the record's type.
std::vector<declaration> exported_declarations(const std::string &header);

// The names after @param in a comment.
std::vector<std::string> documented_parameters(const std::string &comment);

} // namespace quillmere_test
