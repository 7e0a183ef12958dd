#include "xml/reply_reader.h"

#include <cstdlib>
#include <cstring>
#include <utility>

#include "xml/document.h"

namespace quillmere {

namespace {

extern "C" {
static void start_element(void *reader, const char *element, const char **)
{
    static_cast<reply_reader *>(reader)->start(element);
}

static void end_element(void *reader, const char *element)
{
    static_cast<reply_reader *>(reader)->end(element);
}

static void take_text(void *reader, const char *piece, int length)
{
    static_cast<reply_reader *>(reader)->text(piece, length);
}
}

} // namespace

bool reply_reader::read(const char *xml, uint64_t length)
{
    if (!xml || length == 0)
        return false;
    xml_parser parser = new_document_parser(this, {start_element, end_element, take_text});
    parser_ = parser.get();
    bool whole = parse_document(parser, xml, length) == XML_STATUS_OK;
    parser_ = nullptr;
    if (list_)
        list_->finish(whole);
    if (!whole)
        discard();
    return whole;
}

bool reply_reader::take(const char *element, heap_text *text)
{
    uint8_t row = untaken_row(element);
    if (row == element_table::no_row)
        return false;
    lookups_[row].handed_out = true;
    next_row_ = row + size_t{1};
    text->reset(std::exchange(lookups_[row].found, nullptr));
    return true;
}

uint8_t reply_reader::untaken_row(const char *element) const
{
    // Nearly always the elements are asked for in the order of their tables, by the very same text.
    if (next_row_ < lookup_count_ && elements_.rows[next_row_].name.text == element &&
        !lookups_[next_row_].handed_out)
        return static_cast<uint8_t>(next_row_);
    const element_name name(element);
    uint8_t row = elements_.find(name);
    while (row != element_table::no_row && lookups_[row].handed_out)
        row = elements_.find_next(row, name);
    return row;
}

void reply_reader::start(const char *element)
{
    const element_name name(element);
    collect(name);
    if (path_.enter(name, elements_.deepest_path))
        collect(path_.name());
    if (list_ && !list_->start(name))
        XML_StopParser(parser_, XML_FALSE);
}

void reply_reader::end(const char *element)
{
    while (collecting_count_ > 0)
        lookups_[collecting_[--collecting_count_]].collecting = false;
    path_.leave(element, elements_.deepest_path);
    if (list_)
        list_->end(element);
}

void reply_reader::text(const char *piece, int length)
{
    for (size_t i = 0; i < collecting_count_; ++i) {
        lookup &running = lookups_[collecting_[i]];
        running.joined.append(&running.found, piece, length);
    }
    if (list_)
        list_->text(piece, length);
}

void reply_reader::collect(const element_name &name)
{
    for (uint8_t row = elements_.find(name); row != element_table::no_row;
         row = elements_.find_next(row, name)) {
        if (lookups_[row].collecting)
            continue;
        lookups_[row].collecting = true;
        collecting_[collecting_count_++] = row;
    }
}

void reply_reader::discard()
{
    for (size_t row = 0; row < lookup_count_; ++row)
        std::free(std::exchange(lookups_[row].found, nullptr));
}

bool reply_reader::open_path::enter(const element_name &element, int32_t deepest)
{
    depth_ += 1;
    if (depth_ == 0 || depth_ > deepest || lost_at_ >= 0)
        return false;
    if (length_ + 1 + element.length > longest_path) {
        lost_at_ = depth_;
        return false;
    }
    text_[length_] = '/';
    std::memcpy(text_ + length_ + 1, element.text, element.length);
    length_ += 1 + element.length;
    return true;
}

void reply_reader::open_path::leave(const char *element, int32_t deepest)
{
    if (lost_at_ == depth_)
        lost_at_ = -1;
    else if (lost_at_ < 0 && depth_ > 0 && depth_ <= deepest)
        length_ -= 1 + std::strlen(element);
    depth_ -= 1;
}

} // namespace quillmere
