// Everything that a call wants of a reply, read in one pass over it.
#pragma once

#include "owned.h"
#include "xml/element_index.h"
#include "xml/joined_text.h"
#include "xml/list_extraction.h"

namespace quillmere {

// As many lookups in one pass as the longest record needs, and a few.
constexpr size_t most_lookups = 48;

// Each lookup finds what simple_get_xml_node_value() finds: its text begins behind any start tag
// that it names, goes on until the next end tag of whatever element, and is joined from all of its
// places. Nothing is logged: a reply that cannot be read in this way is for those who log it.
class reply_reader {
public:
    reply_reader() = default;
    ~reply_reader() { discard(); }
    reply_reader(const reply_reader &) = delete;
    reply_reader &operator=(const reply_reader &) = delete;

    // The table must outlive the reader, and the extraction, which may be null, the reading.
    template <size_t count>
    void expect(const element_index<count> &elements, list_extraction *list = nullptr)
    {
        static_assert(count <= most_lookups, "there is room for them");
        elements_ = elements.table();
        lookup_count_ = count;
        list_ = list;
    }

    // Whether anything has been expected.
    bool expects() const { return lookup_count_ > 0; }

    // False if the reply is missing or damaged, or if what expat needs is not to be had; then
    // nothing has been found.
    bool read(const char *xml, uint64_t length);

    // Hands out what a whole pass has found for an element: a text, or null. False if the element
    // was not expected, or if its text has been handed out before.
    bool take(const char *element, heap_text *text);

    // For expat.
    void start(const char *element);
    void end(const char *element);
    void text(const char *piece, int length);

private:
    // The path of the innermost open element, kept down to the depth of the deepest one sought.
    class open_path {
    public:
        // False if the path cannot be one that is sought: the root has none, and others are too
        // deep or too long.
        bool enter(const element_name &element, int32_t deepest);
        void leave(const char *element, int32_t deepest);
        element_name name() const { return {text_, length_}; }

    private:
        int64_t depth_ = -1;   // of the root's parent; the root's is 0
        int64_t lost_at_ = -1; // depth from which on the path is too long, if it is
        size_t length_ = 0;
        char text_[longest_path] = {};
    };

    struct lookup {
        char *found = nullptr;
        joined_text joined;
        bool collecting = false;
        bool handed_out = false;
    };

    uint8_t untaken_row(const char *element) const;
    void collect(const element_name &name);
    void discard();

    element_table elements_ = {};
    size_t lookup_count_ = 0;
    list_extraction *list_ = nullptr;
    XML_Parser parser_ = nullptr;
    open_path path_;
    lookup lookups_[most_lookups];
    uint8_t collecting_[most_lookups] = {}; // the rows of those that do, in no order
    size_t collecting_count_ = 0;
    size_t next_row_ = 0; // behind the one taken last
};

} // namespace quillmere
