// Writes the XML of a reply.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace emulator {

/** Elements and their text, properly escaped and nested. Names are the program's own constants. */
class xml_writer {
public:
    /** Begins a document with its declaration. */
    xml_writer();

    void open(const char *name);
    void close();
    /** Throws std::invalid_argument for text that XML cannot carry. */
    void element(const char *name, std::string_view text);
    void element(const char *name, std::uint64_t number);

    /** The document; every element must have been closed. */
    std::string take();

private:
    void escaped(std::string_view text);

    std::string document_;
    std::vector<const char *> open_elements_;
};

} // namespace emulator
